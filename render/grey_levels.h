// From a reduced image of scalar values to grey levels.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <type_traits>

#include "image_view.h"

namespace Qel::Lumetra::ShellExt {

/// The arithmetic in which two values of T are subtracted before the difference is widened to double.
/// 8- and 16-bit values have room to spare in 32 bits. 32-bit signed differences wrap: an image that spans
/// more than 2^31 - 1 maps wrongly, and stays that way.
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

/// The smallest and the largest value of an image. A NaN takes part only as the first value.
template <class T>
struct ValueRange {
  T minimum;
  T maximum;

  explicit ValueRange(std::span<const T> values) : minimum(values.front()), maximum(values.front()) {
    // Each lane sees every kLanes-th value. The result does not depend on it: a NaN as the first value stays
    // in every lane, any other is passed over by every lane.
    constexpr std::size_t kLanes = 32 / sizeof(T);
    std::array<T, kLanes> low;
    std::array<T, kLanes> high;
    low.fill(minimum);
    high.fill(maximum);
    std::size_t i = 0;
    for (; i + kLanes <= values.size(); i += kLanes) {
      for (std::size_t lane = 0; lane < kLanes; ++lane) {
        const T value = values[i + lane];
        low[lane] = value < low[lane] ? value : low[lane];
        high[lane] = value > high[lane] ? value : high[lane];
      }
    }
    for (const T value : values.subspan(i)) Include(value, value);
    for (std::size_t lane = 0; lane < kLanes; ++lane) Include(low[lane], high[lane]);
  }

  /// Grey levels per unit. A flat image is given a range of one, formed in T itself: it wraps at the type's
  /// maximum and vanishes beside large floats, which all comes out as black.
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

 private:
  void Include(T low, T high) {
    if (low < minimum) minimum = low;
    if (high > maximum) maximum = high;
  }
};

/// The low 8 bits of `level` truncated toward zero to 32 bits; 0 for what 32 bits cannot hold, NaN included.
inline std::uint8_t ToGreyLevel(double level) {
  const double fitting = level > -2147483649.0 && level < 2147483648.0 ? level : 0.0;
  return static_cast<std::uint8_t>(static_cast<std::int32_t>(fitting));
}

/// Stretches an image's own range linearly to 0..255. `values` are its pixels, row by row; `bits` has its
/// size.
template <class T>
void MapToGreyLevels(std::span<const T> values, const ImageView<std::uint8_t>& bits) {
  const ValueRange<T> range(values);
  const double scale = range.Scale();
  const auto width = static_cast<std::size_t>(bits.width);
  for (std::int32_t y = 0; y < bits.height; ++y) {
    const T* const row = &values[static_cast<std::size_t>(y) * width];
    auto* const levels = reinterpret_cast<std::uint8_t*>(bits.At(0, y));
    for (std::size_t x = 0; x < width; ++x) {
      levels[x] = ToGreyLevel(Difference(row[x], range.minimum) * scale);
    }
  }
}

}  // namespace Qel::Lumetra::ShellExt
