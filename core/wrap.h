// 32-bit arithmetic that wraps, for formats that define sizes and positions modulo 2^32.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

/// Returns the low 32 bits of `value` in two's complement. Sums and products of 32-bit values that are
/// computed in 64-bit unsigned arithmetic and wrapped once equal those of 32-bit arithmetic that wraps at
/// every step.
constexpr std::int32_t WrapToInt32(std::uint64_t value) {
  return static_cast<std::int32_t>(static_cast<std::uint32_t>(value));
}
constexpr std::int32_t WrapToInt32(std::int64_t value) {
  return WrapToInt32(static_cast<std::uint64_t>(value));
}

/// Returns `a` times `b` modulo 2^32.
constexpr std::int32_t WrappingProduct(std::int32_t a, std::int32_t b) {
  return WrapToInt32(std::int64_t{a} * b);
}

}  // namespace Qel::Lumetra::ShellExt
