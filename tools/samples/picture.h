// The grey picture in which a sample is drawn before it becomes the pixels of a file.
//
// Samples have the same bytes on every machine. Drawing therefore uses only additions, multiplications,
// divisions and square roots, whose results IEEE arithmetic defines exactly. The sines and exponentials of
// standard libraries differ between platforms.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace Qel::Lumetra::ShellExt::Samples {

/// A random number generator with the same numbers for the same seed (SplitMix64).
class Random {
 public:
  explicit Random(std::uint64_t seed) : state_(seed) {}

  std::uint64_t Next();

  /// Returns a number from 0 up to, but not including, 1.
  double Uniform();
  double Uniform(double low, double high) { return low + (high - low) * Uniform(); }

  /// Returns a number with mean 0 and standard deviation 1, between -3.5 and 3.5.
  double Normal();

  /// Returns a random count with the mean `mean`, like that of quanta at a detector.
  int Count(double mean);

 private:
  std::uint64_t state_;
};

/// Returns the sine of `turns` full turns, to about 1e-6.
double Sine(double turns);
inline double Cosine(double turns) {
  return Sine(turns + 0.25);
}

/// Returns the height of a bell curve, which is 1 at 0 and 0 from 1 on.
double Bell(double distance);

inline double Distance(double dx, double dy) {
  return std::sqrt(dx * dx + dy * dy);
}

/// Returns a value that rises smoothly from 0 at `low` to 1 at `high`.
double SmoothStep(double low, double high, double x);

/// A grey picture. Most scenes have values from about 0 to 1, without a unit. Row 0 is the top.
class Picture {
 public:
  Picture(int width, int height, double value = 0);

  int width() const { return width_; }
  int height() const { return height_; }
  const std::vector<double>& values() const { return values_; }

  double& At(int x, int y) { return values_[Index(x, y)]; }
  double At(int x, int y) const { return values_[Index(x, y)]; }

  /// Sets every pixel to `value(x, y)`, row by row from the top left.
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

  /// Adds smooth noise between -strength and strength, whose grain is `grain` pixels wide.
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
