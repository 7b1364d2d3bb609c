#include "read_text.h"

#include <algorithm>
#include <array>

#include "skip_bytes.h"

namespace Qel::Lumetra::ShellExt {

std::string ReadText(std::istream& stream, std::uint32_t length) {
  std::array<char, kMaxTextBytes> bytes;
  const auto kept = std::min(length, static_cast<std::uint32_t>(bytes.size()));
  stream.read(bytes.data(), kept);
  std::string text(bytes.data(), static_cast<std::size_t>(stream.gcount()));
  if (length > kept) SkipBytes(stream, length - kept);
  return text;
}

}  // namespace Qel::Lumetra::ShellExt
