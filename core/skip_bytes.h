// The way past the parts of a file that nobody asks for.
#pragma once

#include <cstdint>
#include <istream>

namespace Qel::Lumetra::ShellExt {

/// Moves `stream` on by `count` bytes, and fails it when it does not hold them all. A count out of a file may
/// be anything: neither memory nor time grows with it.
void SkipBytes(std::istream& stream, std::uint32_t count);

}  // namespace Qel::Lumetra::ShellExt
