#include "skip_bytes.h"

#include <array>

namespace Qel::Lumetra::ShellExt {

void SkipBytes(std::istream& stream, std::uint32_t count) {
  // For a few bytes, reading from the stream's buffer is faster than a seek, which discards the buffer.
  std::array<char, 512> bytes;
  std::streamsize rest = count;
  if (count > bytes.size()) {
    // A position after the end of a file is valid, so the last of the skipped bytes is read to find out
    // whether they exist.
    stream.seekg(rest - 1, std::ios_base::cur);
    rest = 1;
  }
  stream.read(bytes.data(), rest);
}

}  // namespace Qel::Lumetra::ShellExt
