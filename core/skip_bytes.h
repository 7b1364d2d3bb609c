// Skips the parts of a file that no reader needs.
#pragma once

#include <cstdint>
#include <istream>

namespace Qel::Lumetra::ShellExt {

/// Advances `stream` by `count` bytes; fails the stream if it has fewer. Neither memory nor time grows with
/// `count`, which may be any number from a damaged file.
void SkipBytes(std::istream& stream, std::uint32_t count);

}  // namespace Qel::Lumetra::ShellExt
