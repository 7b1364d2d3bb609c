#include "ebn_file.h"

namespace Qel::Lumetra::ShellExt::Testing {

std::string EbnFile::Bytes() const {
  FileBytes file;
  file.Put(typeCode).Put(width).Put(height).Put(dataOffset);
  file.Put(model).Put(source).Put(lens).Put(dNumber).Put(kilovolts);
  return file.Text(afterHeader).bytes();
}

}  // namespace Qel::Lumetra::ShellExt::Testing
