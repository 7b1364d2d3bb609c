#include "image_view.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(ImageView, HasItsFieldsInOrder) {
  using View = ImageView<std::uint8_t>;
  EXPECT_EQ(offsetof(View, width), 0u);
  EXPECT_EQ(offsetof(View, height), 4u);
  EXPECT_EQ(offsetof(View, data), 8u);
  EXPECT_EQ(offsetof(View, pixelStride), 16u);
  EXPECT_EQ(offsetof(View, rowStride), 24u);
  EXPECT_EQ(sizeof(View), 32u);
  EXPECT_TRUE((std::is_same_v<decltype(View::width), std::int32_t>));
  EXPECT_TRUE((std::is_same_v<decltype(View::height), std::int32_t>));
  EXPECT_TRUE((std::is_same_v<decltype(View::pixelStride), std::int64_t>));
  EXPECT_TRUE((std::is_same_v<decltype(View::rowStride), std::int64_t>));
}

TEST(ImageView, FindsPixelsByTheirStrides) {
  const std::uint16_t pixels[] = {0, 1, 2, 3, 4, 5};
  // Three columns and two rows, bottom-up and mirrored.
  const ImageView<const std::uint16_t> view{3, 2, pixels + 5, -2, -6};
  EXPECT_EQ(view.Load(0, 0), 5);
  EXPECT_EQ(view.Load(2, 0), 3);
  EXPECT_EQ(view.Load(0, 1), 2);
  EXPECT_EQ(view.Part(1, 1, 2, 1).Load(1, 0), 0);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
