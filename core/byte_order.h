// Numbers out of file bytes, whatever the host's byte order and the bytes' alignment.
#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace Qel::Lumetra::ShellExt {

/// The little-endian integer at `bytes`, which must hold sizeof(Integer) bytes.
template <class Integer>
constexpr Integer LoadLittleEndian(const unsigned char* bytes) {
  static_assert(std::is_integral_v<Integer>);
  std::make_unsigned_t<Integer> value = 0;
  for (std::size_t i = 0; i < sizeof(Integer); ++i) {
    value = static_cast<decltype(value)>(value | (static_cast<decltype(value)>(bytes[i]) << (8 * i)));
  }
  return static_cast<Integer>(value);
}

/// The IEEE double at `bytes`, stored low byte first.
inline double LoadDouble(const unsigned char* bytes) {
  return std::bit_cast<double>(LoadLittleEndian<std::uint64_t>(bytes));
}

}  // namespace Qel::Lumetra::ShellExt
