#include "mrc_file.h"

namespace Qel::Lumetra::ShellExt::Testing {

std::string MrcFile::Bytes() const {
  FileBytes file(order);
  file.Put(nx).Put(ny).Put(nz).Put(mode);
  file.PadTo(92).Put(next.value_or(static_cast<std::int32_t>(extendedHeader.size())));
  file.PadTo(208).Text("MAP ");
  file.PadTo(220).Put(nlabl.value_or(static_cast<std::int32_t>(labels.size())));
  for (const std::string& label : labels) {
    const std::size_t end = file.size() + 80;
    file.Text(label).PadTo(end);
  }
  return file.PadTo(1024).Text(extendedHeader).Text(pixels).bytes();
}

}  // namespace Qel::Lumetra::ShellExt::Testing
