// Reads strings whose lengths are in the file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <istream>
#include <string>

namespace Qel::Lumetra::ShellExt {

/// The maximum number of bytes that ReadText returns. It is small because the strings are shown in one line
/// and a damaged file may state any length.
inline constexpr std::size_t kMaxTextBytes = 512;

/// Reads a string of `length` bytes and returns at most its first kMaxTextBytes bytes. Fails the stream if it
/// has fewer than `length` bytes.
std::string ReadText(std::istream& stream, std::uint32_t length);

}  // namespace Qel::Lumetra::ShellExt
