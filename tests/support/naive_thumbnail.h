// Computes the expected picture of a frame in the simplest way: the whole frame is a vector of values, top
// row first, and each step is a plain loop. It shares no code with what it checks.
#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt::Testing {

template <class T>
struct NaiveFrame {
  int width = 0;
  int height = 0;
  std::vector<T> values;  // rows from the top

  const T& at(int x, int y) const {
    return values[static_cast<std::size_t>(y) * static_cast<std::size_t>(width) +
                  static_cast<std::size_t>(x)];
  }
};

/// Returns the average of each whole block of f by f pixels, summed as doubles.
template <class T>
NaiveFrame<T> NaiveReduce(const NaiveFrame<T>& frame, int f) {
  NaiveFrame<T> reduced{frame.width / f, frame.height / f, {}};
  for (int by = 0; by < reduced.height; ++by) {
    for (int bx = 0; bx < reduced.width; ++bx) {
      double sum = 0;
      for (int y = 0; y < f; ++y) {
        for (int x = 0; x < f; ++x) sum += static_cast<double>(frame.at(bx * f + x, by * f + y));
      }
      const double average = sum * (1.0 / (f * f));
      if constexpr (std::is_same_v<T, double>) {
        reduced.values.push_back(average);
      } else if constexpr (std::is_same_v<T, float>) {
        reduced.values.push_back(static_cast<float>(average));
      } else {
        reduced.values.push_back(static_cast<T>(static_cast<std::int64_t>(average)));
      }
    }
  }
  return reduced;
}

template <class T>
double NaiveDifference(T a, T b) {
  if constexpr (std::is_same_v<T, std::int32_t>) {
    std::int64_t difference = std::int64_t{a} - std::int64_t{b};
    const std::int64_t turn = std::int64_t{1} << 32;
    while (difference > std::numeric_limits<std::int32_t>::max()) difference -= turn;
    while (difference < std::numeric_limits<std::int32_t>::min()) difference += turn;
    return static_cast<double>(difference);
  } else if constexpr (std::is_same_v<T, std::uint32_t>) {
    return static_cast<double>(a - b);
  } else if constexpr (std::is_same_v<T, float>) {
    const float difference = a - b;
    return difference;
  } else {
    return static_cast<double>(a) - static_cast<double>(b);
  }
}

/// Returns the grey picture of a frame of one of the eight scalar types, for a request of `cx` by `cy`.
template <class T>
BitmapPixels NaiveGreyThumbnail(const NaiveFrame<T>& frame, int cx, int cy) {
  const int f = std::max({frame.width / cx, frame.height / cy, 1});
  const NaiveFrame<T> reduced = NaiveReduce(frame, f);
  BitmapPixels picture;
  if (reduced.values.empty()) return picture;
  T minimum = reduced.values[0];
  T maximum = reduced.values[0];
  for (const T value : reduced.values) {
    if (value < minimum) minimum = value;
    if (value > maximum) maximum = value;
  }
  T upper = maximum;
  if (minimum == maximum || std::isnan(static_cast<double>(minimum)) ||
      std::isnan(static_cast<double>(maximum))) {
    if constexpr (std::is_integral_v<T>) {
      upper = minimum == std::numeric_limits<T>::max() ? std::numeric_limits<T>::min()
                                                       : static_cast<T>(minimum + 1);
    } else {
      upper = minimum + static_cast<T>(1);
    }
  }
  const double scale = 255.0 / NaiveDifference(upper, minimum);
  picture.width = reduced.width;
  picture.height = reduced.height;
  picture.bits = 8;
  for (const T value : reduced.values) {
    const double grey = std::trunc(NaiveDifference(value, minimum) * scale);
    // The result is the low 8 bits of a 32-bit integer. A value outside its range gives black.
    const bool fits = grey >= -2147483648.0 && grey <= 2147483647.0;
    const std::int64_t level = fits ? static_cast<std::int64_t>(grey) : 0;
    picture.bytes.push_back(static_cast<std::uint8_t>(level & 0xFF));
  }
  return picture;
}

template <class T>
struct NaiveComplex {
  T re;
  T im;
};

/// Returns the grey picture of ln(re² + im²).
template <class T>
BitmapPixels NaiveComplexThumbnail(const NaiveFrame<NaiveComplex<T>>& frame, int cx, int cy) {
  NaiveFrame<float> logarithms{frame.width, frame.height, {}};
  for (const NaiveComplex<T>& value : frame.values) {
    const auto re = static_cast<double>(value.re);
    const auto im = static_cast<double>(value.im);
    logarithms.values.push_back(static_cast<float>(std::log(re * re + im * im)));
  }
  return NaiveGreyThumbnail(logarithms, cx, cy);
}

using NaiveColour = std::array<std::uint8_t, 3>;  // red, green, blue

/// Returns the colour picture, whose bytes are blue first. The frame must not be smaller than the request.
inline BitmapPixels NaiveColourThumbnail(const NaiveFrame<NaiveColour>& frame, int cx, int cy) {
  const int f = std::max(frame.width / cx, frame.height / cy);
  BitmapPixels picture;
  NaiveFrame<std::uint8_t> channels[3];
  for (std::size_t channel = 0; channel < 3; ++channel) {
    NaiveFrame<std::uint8_t> plane{frame.width, frame.height, {}};
    for (const NaiveColour& colour : frame.values) plane.values.push_back(colour[channel]);
    channels[channel] = NaiveReduce(plane, f);
  }
  if (channels[0].values.empty()) return picture;
  picture.width = frame.width / f;
  picture.height = frame.height / f;
  picture.bits = 24;
  for (std::size_t i = 0; i < channels[0].values.size(); ++i) {
    for (const std::size_t channel : {2u, 1u, 0u}) picture.bytes.push_back(channels[channel].values[i]);
  }
  return picture;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
