// Damages files: overwrites fields of a header with values at which computations tend to go wrong.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Testing {

/// Values around the limits of 7, 8, 15, 16, 24, 30, 31 and 32 bits, and the square root of 2^31.
inline constexpr std::uint32_t kBoundaryValues[] = {
    0,          1,          2,          0x7F,       0x80,       0xFF,       0x100,      0x7FFF,
    0x8000,     0xFFFF,     0x10000,    0x10001,    46341,      0x00FFFFFF, 0x01000000, 0x3FFFFFFF,
    0x40000000, 0x7FFFFFFE, 0x7FFFFFFF, 0x80000000, 0x80000001, 0xFFFFFC00, 0xFFFFFFFE, 0xFFFFFFFF};

/// Writes four bytes at `offset`, the lowest first.
inline void PutField(std::string& bytes, std::size_t offset, std::uint32_t value) {
  for (std::size_t i = 0; i < 4; ++i) bytes[offset + i] = static_cast<char>(value >> (8 * i));
}

}  // namespace Qel::Lumetra::ShellExt::Testing
