// Texts of a file whose length is in the file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <istream>
#include <string>

namespace Qel::Lumetra::ShellExt {

/// Longer texts are cut: they are for one line on a screen, and a length out of a file may be anything.
inline constexpr std::size_t kMaxTextBytes = 512;

/// Moves `stream` on by the `length` bytes of a text and returns the first kMaxTextBytes of them. Fails the
/// stream if it does not hold them all.
std::string ReadText(std::istream& stream, std::uint32_t length);

}  // namespace Qel::Lumetra::ShellExt
