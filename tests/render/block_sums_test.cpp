// Tests sums at the limits of the lanes and folds, where a type one size too narrow would overflow.
#include "block_sums.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <limits>
#include <vector>

namespace Qel::Lumetra::ShellExt {
namespace {

/// Returns the sum of a block of `factor` by `factor` samples that are all `value`.
template <class T>
std::int64_t SumOfSquare(std::int32_t factor, T value) {
  const std::vector<T> row(static_cast<std::size_t>(factor), value);
  ExactBlockSums<T> sums(1, factor);
  sums.Add({factor, factor, row.data(), sizeof(T), 0}, 0);  // the row stride is 0: all rows are the same
  return static_cast<std::int64_t>(sums.sums()[0]);
}

template <class T>
class ExactBlockSumsOf : public testing::Test {};
using ExactSamples = testing::Types<std::uint8_t, std::int8_t, std::uint16_t, std::int16_t>;
TYPED_TEST_SUITE(ExactBlockSumsOf, ExactSamples);

TYPED_TEST(ExactBlockSumsOf, ExtremeValuesDoNotOverflowAtAnyFactor) {
  using Limits = std::numeric_limits<TypeParam>;
  // Blocks of 181 by 181 16-bit samples are the largest that are folded in 32 bits. 8-bit lanes hold 255
  // rows.
  for (const std::int32_t factor : {2, 8, 15, 16, 181, 182, 200, 255, 256, 257, 258, 259, 300, 600}) {
    for (const TypeParam value : {Limits::min(), Limits::max()}) {
      EXPECT_EQ(SumOfSquare(factor, value), std::int64_t{factor} * factor * value) << factor;
    }
  }
}

TYPED_TEST(ExactBlockSumsOf, ExtremeValuesDoNotOverflowInBlocksOfManyRows) {
  using Limits = std::numeric_limits<TypeParam>;
  // Sums a few columns of a block of 40,000 by 40,000 pixels, whose rows are all the same.
  constexpr std::int32_t kFactor = 40000;
  for (const TypeParam value : {Limits::min(), Limits::max()}) {
    std::array<TypeParam, 9> row;
    row.fill(value);
    ExactBlockSums<TypeParam> sums(1, kFactor);
    sums.Add({static_cast<std::int32_t>(row.size()), kFactor, row.data(), sizeof(TypeParam), 0}, 0);
    EXPECT_EQ(sums.sums()[0], static_cast<double>(row.size()) * kFactor * value);
  }
}

TEST(ExactBlockSums, ColoursDoNotOverflowAtAnyFactor) {
  for (const std::int32_t factor : {2, 15, 16, 255, 256, 257, 258, 300, 600}) {
    const std::vector<RgbPixel> row(static_cast<std::size_t>(factor), RgbPixel{{255, 254, 1}});
    ExactBlockSums<RgbPixel> sums(1, factor);
    sums.Add({factor, factor, row.data(), sizeof(RgbPixel), 0}, 0);
    const double count = static_cast<double>(factor) * factor;
    EXPECT_EQ(sums.sums()[0], count * 1) << factor;
    EXPECT_EQ(sums.sums()[1], count * 254) << factor;
    EXPECT_EQ(sums.sums()[2], count * 255) << factor;
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
