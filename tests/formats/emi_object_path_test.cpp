#include "emi_object_path.h"

#include <gtest/gtest.h>

#include <limits>
#include <stdexcept>

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr EmiItemId kOuter = {0x4100, 1};
constexpr EmiItemId kMiddle = {0x49B0, 2};
constexpr EmiItemId kInner = {0x0060, 3};

EmiObjectPath ThreeItems() {
  EmiObjectPath path;
  path.Open(kOuter);
  path.Open(kMiddle);
  path.Open(kInner);
  return path;
}

TEST(EmiObjectPath, NegativeIndexesCountFromTheInnermostItem) {
  const EmiObjectPath path = ThreeItems();
  EXPECT_EQ(path.At(-1), kInner);
  EXPECT_EQ(path.At(-2), kMiddle);
  EXPECT_EQ(path.At(-3), kOuter);
}

TEST(EmiObjectPath, OtherIndexesCountFromTheOutermostItem) {
  const EmiObjectPath path = ThreeItems();
  EXPECT_EQ(path.At(0), kOuter);
  EXPECT_EQ(path.At(1), kMiddle);
  EXPECT_EQ(path.At(2), kInner);
}

TEST(EmiObjectPath, AnIndexOutsideThePathIsAnInvalidArgument) {
  constexpr auto kMin = std::numeric_limits<std::ptrdiff_t>::min();
  constexpr auto kMax = std::numeric_limits<std::ptrdiff_t>::max();
  const EmiObjectPath path = ThreeItems();
  for (const std::ptrdiff_t index : {kMin, std::ptrdiff_t{-4}, std::ptrdiff_t{3}, kMax}) {
    try {
      path.At(index);
      ADD_FAILURE() << index;
    } catch (const std::invalid_argument& error) {
      EXPECT_STREQ(error.what(), "bad EMI object index");
    }
  }
  EXPECT_THROW(EmiObjectPath().At(0), std::invalid_argument);
  EXPECT_THROW(EmiObjectPath().At(-1), std::invalid_argument);
}

TEST(EmiObjectPath, FollowsOpenedAndClosedItems) {
  EmiObjectPath path = ThreeItems();
  path.CloseInnermost();
  EXPECT_EQ(path.At(-1), kMiddle);
  EXPECT_THROW(path.At(2), std::invalid_argument);
  path.CloseInnermost();
  path.CloseInnermost();
  EXPECT_TRUE(path.empty());
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
