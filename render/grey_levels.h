// Maps a reduced image of scalar values to grey levels.
#pragma once

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

#include "image_view.h"

namespace Qel::Lumetra::ShellExt {

/// Returns a - b, subtracted as T and then widened to double. 8- and 16-bit differences are exact. 32-bit
/// signed differences wrap, so an image that spans more than 2^31 - 1 maps wrongly; this is intentional.
template <class T>
double Difference(T a, T b) {
  if constexpr (std::is_floating_point_v<T>) {
    return static_cast<T>(a - b);
  } else if constexpr (sizeof(T) < 4) {
    return std::int32_t{a} - std::int32_t{b};
  } else {
    return static_cast<T>(static_cast<std::uint32_t>(a) - static_cast<std::uint32_t>(b));
  }
}

/// The smallest and the largest value of an image. A NaN is ignored, unless it is the first value: then it is
/// both the smallest and the largest.
template <class T>
struct ValueRange {
  T minimum;
  T maximum;

  /// Finds the range of `count` values, at least one.
  ValueRange(const T* values, std::size_t count) : minimum(values[0]), maximum(values[0]) {
    // Each lane compares only some of the values. The result is the same: all lanes begin with the first
    // value, so a NaN there stays in each of them, and every lane ignores any other NaN. The vectors are
    // explicit because GCC does not vectorise this loop for floats.
    using Vector __attribute__((vector_size(16))) = T;
    constexpr std::size_t kLanes = sizeof(Vector) / sizeof(T);
    constexpr std::size_t kVectors = 4;
    Vector low[kVectors];
    Vector high[kVectors];
    for (std::size_t j = 0; j < kVectors; ++j) low[j] = high[j] = Vector{} + minimum;
    std::size_t i = 0;
    for (; i + kVectors * kLanes <= count; i += kVectors * kLanes) {
      for (std::size_t j = 0; j < kVectors; ++j) {
        Vector some;
        std::memcpy(&some, values + i + j * kLanes, sizeof some);
        low[j] = some < low[j] ? some : low[j];
        high[j] = some > high[j] ? some : high[j];
      }
    }
    for (; i < count; ++i) Include(values[i], values[i]);
    for (std::size_t j = 0; j < kVectors; ++j) {
      for (std::size_t lane = 0; lane < kLanes; ++lane) Include(low[j][lane], high[j][lane]);
    }
  }

  /// Returns the grey levels per unit. For a flat image the maximum is replaced by the minimum plus one,
  /// computed in T. If the minimum is the largest integer, the sum wraps; if it is a large float, the sum
  /// equals it. In both cases every pixel is black.
  double Scale() const {
    T upper = maximum;
    if (!(minimum < maximum || minimum > maximum)) {
      if constexpr (std::is_floating_point_v<T>) {
        upper = minimum + T{1};
      } else {
        upper = static_cast<T>(static_cast<std::make_unsigned_t<T>>(minimum) + 1u);
      }
    }
    return 255.0 / Difference(upper, minimum);
  }

  /// Writes the grey levels of `count` values, before they are truncated.
  void Stretch(const T* values, std::size_t count, double scale, double* levels) const {
    for (std::size_t i = 0; i < count; ++i) levels[i] = Difference(values[i], minimum) * scale;
  }

 private:
  void Include(T low, T high) {
    if (low < minimum) minimum = low;
    if (high > maximum) maximum = high;
  }
};

/// Truncates each of `count` levels toward zero to 32 bits and writes the low 8 bits. A NaN and a level that
/// 32 bits cannot hold give 0, as the conversion of x86 does. Reads `levels` up to the next multiple of 8
/// values.
inline void Truncate(const double* levels, std::size_t count, std::uint8_t* bytes) {
#ifdef __SSE2__
  const auto four = [levels](std::size_t i) {
    const __m128i two = _mm_cvttpd_epi32(_mm_loadu_pd(levels + i));
    const __m128i others = _mm_cvttpd_epi32(_mm_loadu_pd(levels + i + 2));
    return _mm_and_si128(_mm_unpacklo_epi64(two, others), _mm_set1_epi32(0xFF));
  };
  for (std::size_t i = 0; i < count; i += 8) {
    const __m128i words = _mm_packs_epi32(four(i), four(i + 4));
    std::uint8_t eight[8];
    _mm_storel_epi64(reinterpret_cast<__m128i*>(eight), _mm_packus_epi16(words, words));
    std::memcpy(bytes + i, eight, std::min<std::size_t>(count - i, 8));
  }
#else
  for (std::size_t i = 0; i < count; ++i) {
    const bool fits = levels[i] > -2147483649.0 && levels[i] < 2147483648.0;
    bytes[i] = static_cast<std::uint8_t>(fits ? static_cast<std::int32_t>(levels[i]) : 0);
  }
#endif
}

/// Stretches the image's own range linearly to 0..255 and stores the levels in `bits`. `values` has a value
/// for each pixel of `bits`, row by row, and at least one.
template <class T>
void MapToGreyLevels(const T* values, const ImageView<std::uint8_t>& bits) {
  // Small enough for the processor's registers. Bytes are widened 16 at a time, hence the larger batch.
  constexpr std::size_t kBatch = sizeof(T) == 1 ? 32 : 8;
  const auto width = static_cast<std::size_t>(bits.width);
  const ValueRange<T> range(values, width * static_cast<std::size_t>(bits.height));
  const double scale = range.Scale();
  std::array<double, kBatch> levels{};
  for (std::int32_t y = 0; y < bits.height; ++y, values += width) {
    auto* const row = reinterpret_cast<std::uint8_t*>(bits.At(0, y));
    std::size_t x = 0;
    const auto map = [&](std::size_t count) {
      range.Stretch(values + x, count, scale, levels.data());
      Truncate(levels.data(), count, row + x);
    };
    for (; x + kBatch <= width; x += kBatch) map(kBatch);
    map(width - x);
  }
}

}  // namespace Qel::Lumetra::ShellExt
