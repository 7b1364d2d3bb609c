#include "skip_bytes.h"

#include <array>

namespace Qel::Lumetra::ShellExt {

void SkipBytes(std::istream& stream, std::uint32_t count) {
  // Reading ahead in the stream's own buffer is faster than a seek, which discards the buffer.
  std::array<char, 512> bytes;
  std::streamsize rest = count;
  if (count > bytes.size()) {
    // A position after the end of a file is valid, so reading the last byte shows whether the part exists.
    stream.seekg(rest - 1, std::ios_base::cur);
    rest = 1;
  }
  stream.read(bytes.data(), rest);
}

}  // namespace Qel::Lumetra::ShellExt
