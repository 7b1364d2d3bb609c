// The grey picture in which a sample is drawn before it becomes the pixels of a file.
//
// Samples shall have the same bytes on every machine. So drawing uses nothing but additions, multiplications,
// divisions and square roots, which IEEE arithmetic rounds in one way only; the sines and bell curves of the
// standard library differ from one platform to the next.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace Qel::Lumetra::ShellExt::Samples {

/// Numbers that are the same for the same seed (SplitMix64).
class Random {
 public:
  explicit Random(std::uint64_t seed) : state_(seed) {}

  std::uint64_t Next();

  /// From 0 up to, not including, 1.
  double Uniform();
  double Uniform(double low, double high) { return low + (high - low) * Uniform(); }

  /// Of mean 0 and standard deviation 1, and never further than 3.5 from 0.
  double Normal();

  /// A count whose mean is `mean`, as quanta arrive at a detector.
  int Count(double mean);

 private:
  std::uint64_t state_;
};

/// The sine of `turns` full turns, to about 1e-6.
double Sine(double turns);
inline double Cosine(double turns) {
  return Sine(turns + 0.25);
}

/// A bell of height 1 around 0 that has faded to 0 at 1 and beyond.
double Bell(double distance);

inline double Distance(double dx, double dy) {
  return std::sqrt(dx * dx + dy * dy);
}

/// From 0 below `low` to 1 above `high` without a corner.
double SmoothStep(double low, double high, double x);

/// Values without a scale of their own; most scenes stay near 0 to 1. Row 0 is the top.
class Picture {
 public:
  Picture(int width, int height, double value = 0);

  int width() const { return width_; }
  int height() const { return height_; }
  const std::vector<double>& values() const { return values_; }

  double& At(int x, int y) { return values_[Index(x, y)]; }
  double At(int x, int y) const { return values_[Index(x, y)]; }

  /// Sets every pixel to `value(x, y)`, from the top left, row by row.
  template <class Value>
  void Fill(Value value) {
    for (int y = 0; y < height_; ++y) {
      for (int x = 0; x < width_; ++x) At(x, y) = value(x, y);
    }
  }

  /// Adds `value(distance)` to every pixel nearer than `radius` to a point. The distance is in pixels.
  template <class Value>
  void AddDisc(double centreX, double centreY, double radius, Value value) {
    const int left = std::max(0, static_cast<int>(centreX - radius));
    const int right = std::min(width_ - 1, static_cast<int>(centreX + radius) + 1);
    const int top = std::max(0, static_cast<int>(centreY - radius));
    const int bottom = std::min(height_ - 1, static_cast<int>(centreY + radius) + 1);
    for (int y = top; y <= bottom; ++y) {
      for (int x = left; x <= right; ++x) {
        const double distance = Distance(x - centreX, y - centreY);
        if (distance < radius) At(x, y) += value(distance);
      }
    }
  }

  /// Adds noise with the standard deviation `deviation` to every pixel.
  void AddNoise(Random& random, double deviation);

  /// Adds soft unevenness: noise whose grain is `grain` pixels wide, between -strength and strength.
  void AddClouds(Random& random, double grain, double strength);

 private:
  std::size_t Index(int x, int y) const {
    return static_cast<std::size_t>(y) * static_cast<std::size_t>(width_) + static_cast<std::size_t>(x);
  }

  int width_;
  int height_;
  std::vector<double> values_;
};

}  // namespace Qel::Lumetra::ShellExt::Samples
