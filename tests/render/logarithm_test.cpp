#include "logarithm.h"

#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <numbers>
#include <vector>

#include "random_values.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::Random;
using Implementation = void (*)(const double*, std::size_t, float*);

/// Compares bits, so that the sign of a zero and a NaN count.
void ExpectTheLibrarysLogarithms(Implementation implementation, const std::vector<double>& values) {
  std::vector<float> logarithms(values.size());
  implementation(values.data(), values.size(), logarithms.data());
  for (std::size_t i = 0; i < values.size(); ++i) {
    const auto expected = static_cast<float>(std::log(values[i]));
    if (std::isnan(expected)) {
      ASSERT_TRUE(std::isnan(logarithms[i])) << values[i];
    } else {
      ASSERT_EQ(std::bit_cast<std::uint32_t>(logarithms[i]), std::bit_cast<std::uint32_t>(expected))
          << values[i];
    }
  }
}

/// Returns the implementations that this processor can run.
std::vector<Implementation> Implementations() {
  std::vector<Implementation> implementations{LogarithmsToFloatBaseline, LogarithmsToFloat};
  if (HasAvx2()) implementations.push_back(LogarithmsToFloatAvx2);
  return implementations;
}

class EveryImplementation : public testing::TestWithParam<Implementation> {
 protected:
  static void Expect(const std::vector<double>& values) { ExpectTheLibrarysLogarithms(GetParam(), values); }
};

TEST_P(EveryImplementation, SpecialValues) {
  using Limits = std::numeric_limits<double>;
  Expect({0.0,
          -0.0,
          1.0,
          -1.0,
          Limits::infinity(),
          -Limits::infinity(),
          Limits::quiet_NaN(),
          Limits::min(),
          Limits::denorm_min(),
          Limits::max(),
          Limits::min() / 3,
          std::nextafter(1.0, 0.0),
          std::nextafter(1.0, 2.0),
          0.5,
          2.0,
          std::sqrt(0.5),
          std::numbers::sqrt2,
          1e-300,
          1e300,
          10.0});
}

TEST_P(EveryImplementation, EveryExponent) {
  Random random(1);
  std::vector<double> values;
  for (int i = 0; i < 300'000; ++i) values.push_back(std::bit_cast<double>(random.Bits()));
  Expect(values);
}

TEST_P(EveryImplementation, SumsOfTwoSquares) {
  Random random(2);
  std::vector<double> values;
  for (int i = 0; i < 1'000'000; ++i) {
    const double re = random.Between(-32768, 32767);
    const double im = static_cast<float>(random.Between(-1'000'000, 1'000'000)) / 1024.0f;
    values.push_back(i % 2 == 0 ? re * re + std::trunc(im) * std::trunc(im) : re * re + im * im);
  }
  Expect(values);
}

TEST_P(EveryImplementation, AroundOne) {
  Random random(3);
  std::vector<double> values;
  for (int i = 0; i < 300'000; ++i) {
    values.push_back(1.0 + std::ldexp(static_cast<double>(random.Between(-1'000'000, 1'000'000)),
                                      -random.Between(20, 70)));
  }
  Expect(values);
}

TEST_P(EveryImplementation, EveryLengthOfABatch) {
  Random random(4);
  for (const std::size_t length : {0u, 1u, 3u, 255u, 256u, 257u, 513u}) {
    std::vector<double> values;
    while (values.size() < length) values.push_back(random.OneIn(5) ? 0.0 : random.Between(1, 100));
    Expect(values);
  }
}

INSTANTIATE_TEST_SUITE_P(Logarithm, EveryImplementation, testing::ValuesIn(Implementations()));

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
