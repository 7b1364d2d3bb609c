// Random frames for comparisons with the naive pictures. They are seeded, and the same on every platform.
#pragma once

#include <bit>
#include <cstdint>
#include <limits>
#include <random>
#include <type_traits>

#include "naive_thumbnail.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Distributions of values. Each has found faults in code like the renderer's.
enum class Values { kSmall, kWholeRange, kMinimum, kMaximum, kSparse, kNotFinite, kNaNFirst, kCount };

class Random {
 public:
  explicit Random(std::uint32_t seed) : engine_(seed) {}

  std::uint64_t Bits() { return (std::uint64_t{engine_()} << 32) | engine_(); }

  /// Returns a number from `first` to `last`, both included.
  int Between(int first, int last) {
    return first + static_cast<int>(Bits() % static_cast<std::uint64_t>(last - first + 1));
  }

  bool OneIn(int n) { return Between(1, n) == 1; }

  template <class T>
  T Value(Values values, bool first) {
    using Limits = std::numeric_limits<T>;
    switch (values) {
      case Values::kWholeRange: return WholeRange<T>();
      case Values::kMinimum: return Limits::lowest();
      case Values::kMaximum: return Limits::max();
      case Values::kSparse: return OneIn(50) ? Limits::max() : static_cast<T>(7);
      case Values::kNotFinite:
      case Values::kNaNFirst:
        if constexpr (std::is_floating_point_v<T>) {
          if (values == Values::kNaNFirst ? first : OneIn(40)) return Limits::quiet_NaN();
          if (OneIn(200)) return OneIn(2) ? Limits::infinity() : -Limits::infinity();
        }
        [[fallthrough]];
      default: break;
    }
    if constexpr (std::is_floating_point_v<T>) {
      return static_cast<T>(Between(-100000, 100000)) / static_cast<T>(997);
    } else {
      return static_cast<T>(Between(0, 100));
    }
  }

  template <class T>
  NaiveFrame<T> Frame(int width, int height, Values values) {
    NaiveFrame<T> frame{width, height, {}};
    for (int i = 0; i < width * height; ++i) frame.values.push_back(Value<T>(values, i == 0));
    return frame;
  }

 private:
  template <class T>
  T WholeRange() {
    if constexpr (std::is_integral_v<T>) {
      return static_cast<T>(Bits());
    } else {
      const double sign = OneIn(2) ? 1.0 : -1.0;
      const double fraction = static_cast<double>(Bits() >> 11) / 9007199254740992.0;
      return static_cast<T>(sign * fraction * static_cast<double>(std::numeric_limits<T>::max()) / 4.0);
    }
  }

  std::mt19937 engine_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
