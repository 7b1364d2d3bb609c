#include "picture.h"

#include <numbers>

namespace Qel::Lumetra::ShellExt::Samples {

std::uint64_t Random::Next() {
  state_ += 0x9E3779B97F4A7C15u;
  std::uint64_t z = state_;
  z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
  z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
  return z ^ (z >> 31);
}

double Random::Uniform() {
  return static_cast<double>(Next() >> 11) * 0x1p-53;
}

double Random::Normal() {
  // The sum of four uniform numbers, scaled to a standard deviation of 1.
  double sum = 0;
  for (int i = 0; i < 4; ++i) sum += Uniform();
  return (sum - 2) * std::numbers::sqrt3;
}

int Random::Count(double mean) {
  if (mean <= 0) return 0;
  if (mean > 30) return static_cast<int>(std::max(0.0, mean + Normal() * std::sqrt(mean) + 0.5));
  // A binomial distribution of many trials with small probability approximates a Poisson distribution.
  constexpr int kTrials = 64;
  int count = 0;
  for (int i = 0; i < kTrials; ++i) count += Uniform() * kTrials < mean ? 1 : 0;
  return count;
}

double Sine(double turns) {
  double x = turns - std::floor(turns);  // 0 to 1
  const double sign = x < 0.5 ? 1 : -1;
  if (x >= 0.5) x -= 0.5;     // half a turn
  if (x > 0.25) x = 0.5 - x;  // a quarter of a turn
  const double angle = x * 6.283185307179586;
  const double square = angle * angle;
  return sign * angle *
         (1 - square / 6 * (1 - square / 20 * (1 - square / 42 * (1 - square / 72 * (1 - square / 110)))));
}

double Bell(double distance) {
  if (distance >= 1) return 0;
  const double rest = 1 - distance * distance;
  return rest * rest * rest;
}

double SmoothStep(double low, double high, double x) {
  const double t = std::clamp((x - low) / (high - low), 0.0, 1.0);
  return t * t * (3 - 2 * t);
}

Picture::Picture(int width, int height, double value)
    : width_(width),
      height_(height),
      values_(static_cast<std::size_t>(width) * static_cast<std::size_t>(height), value) {}

void Picture::AddNoise(Random& random, double deviation) {
  for (double& value : values_) value += deviation * random.Normal();
}

void Picture::AddClouds(Random& random, double grain, double strength) {
  // Interpolates smoothly between random values at the corners of a coarse grid.
  const int columns = static_cast<int>(width_ / grain) + 2;
  const int rows = static_cast<int>(height_ / grain) + 2;
  Picture corners(columns, rows);
  corners.Fill([&](int, int) { return random.Uniform(-strength, strength); });
  for (int y = 0; y < height_; ++y) {
    const int row = static_cast<int>(y / grain);
    const double down = SmoothStep(0, 1, y / grain - row);
    for (int x = 0; x < width_; ++x) {
      const int column = static_cast<int>(x / grain);
      const double right = SmoothStep(0, 1, x / grain - column);
      const double above =
          corners.At(column, row) + right * (corners.At(column + 1, row) - corners.At(column, row));
      const double below = corners.At(column, row + 1) +
                           right * (corners.At(column + 1, row + 1) - corners.At(column, row + 1));
      At(x, y) += above + down * (below - above);
    }
  }
}

}  // namespace Qel::Lumetra::ShellExt::Samples
