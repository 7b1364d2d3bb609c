// From a reduced image of scalar values to grey levels.
#pragma once

#include <cstdint>
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

  explicit ValueRange(const ImageView<const T>& image) : minimum(image.Load(0, 0)), maximum(minimum) {
    for (std::int32_t y = 0; y < image.height; ++y) {
      for (std::int32_t x = 0; x < image.width; ++x) {
        const T value = image.Load(x, y);
        if (value < minimum) minimum = value;
        if (value > maximum) maximum = value;
      }
    }
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
};

/// The low 8 bits of `level` truncated toward zero to 32 bits; 0 for what 32 bits cannot hold, NaN included.
inline std::uint8_t ToGreyLevel(double level) {
  const bool fits = level > -2147483649.0 && level < 2147483648.0;
  return fits ? static_cast<std::uint8_t>(static_cast<std::int32_t>(level)) : std::uint8_t{0};
}

/// Stretches the image's own range linearly to 0..255. `bits` has the image's size.
template <class T>
void MapToGreyLevels(const ImageView<const T>& image, const ImageView<std::uint8_t>& bits) {
  const ValueRange<T> range(image);
  const double scale = range.Scale();
  for (std::int32_t y = 0; y < image.height; ++y) {
    for (std::int32_t x = 0; x < image.width; ++x) {
      bits.Store(x, y, ToGreyLevel(Difference(image.Load(x, y), range.minimum) * scale));
    }
  }
}

}  // namespace Qel::Lumetra::ShellExt
