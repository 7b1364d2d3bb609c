// Decodes the little-endian numbers of a file, whatever the host's byte order and the alignment of the bytes.
#pragma once

#include <array>
#include <bit>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <istream>
#include <type_traits>

namespace Qel::Lumetra::ShellExt {

/// Decodes an integer or an IEEE float or double from the sizeof(Number) bytes at `bytes`, least significant
/// byte first.
template <class Number>
constexpr Number LoadLittleEndian(const unsigned char* bytes) {
  if constexpr (std::floating_point<Number>) {
    using Bits = std::conditional_t<sizeof(Number) == 4, std::uint32_t, std::uint64_t>;
    return std::bit_cast<Number>(LoadLittleEndian<Bits>(bytes));
  } else {
    std::make_unsigned_t<Number> value = 0;
    for (std::size_t i = 0; i < sizeof(Number); ++i) {
      value = static_cast<decltype(value)>(value | (static_cast<decltype(value)>(bytes[i]) << (8 * i)));
    }
    return static_cast<Number>(value);
  }
}

/// Reads and decodes the number at the stream's position. If the stream ends before the number does, the
/// missing bytes count as 0 and the stream fails.
template <class Number>
Number ReadLittleEndian(std::istream& stream) {
  std::array<unsigned char, sizeof(Number)> bytes{};
  stream.read(reinterpret_cast<char*>(bytes.data()), bytes.size());
  return LoadLittleEndian<Number>(bytes.data());
}

}  // namespace Qel::Lumetra::ShellExt
