#include "dib_section.h"

#include <gtest/gtest.h>

#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(DibSection, GreyHeaderIsComplete) {
  DibSection section;
  section.CreateGrey(5, 3);
  EXPECT_EQ(section.Bits().width, 5);
  EXPECT_EQ(section.Bits().height, 3);
  EXPECT_EQ(section.Bits().pixelStride, 1);
  EXPECT_EQ(section.Bits().rowStride, 8);
  ASSERT_NE(section.Bits().data, nullptr);
  section.Bits().Store(4, 2, 99);
  const auto pixels = Testing::TakeBitmap(section.Release());
  EXPECT_EQ(pixels.bytes.back(), 99);
  EXPECT_EQ(pixels.header.biSize, 40u);
  EXPECT_EQ(pixels.header.biPlanes, 1);
  EXPECT_EQ(pixels.header.biSizeImage, 2u * 8u + 5u);
  EXPECT_EQ(pixels.header.biXPelsPerMeter, 1200);
  EXPECT_EQ(pixels.header.biYPelsPerMeter, 1200);
}

TEST(DibSection, ColourBitsHaveThreeBytesAPixel) {
  DibSection section;
  section.CreateColour(3, 2);
  EXPECT_EQ(section.Bits().pixelStride, 3);
  EXPECT_EQ(section.Bits().rowStride, 12);
}

TEST(DibSection, IsEmptyAfterRelease) {
  DibSection section;
  section.CreateGrey(2, 2);
  const HBITMAP bitmap = section.Release();
  EXPECT_NE(bitmap, nullptr);
  EXPECT_EQ(section.Release(), nullptr);
  EXPECT_EQ(section.Bits().data, nullptr);
  DeleteObject(bitmap);
}

TEST(DibSection, ANewBitmapReplacesTheOld) {
  DibSection section;
  section.CreateGrey(2, 2);
  section.CreateColour(4, 1);
  EXPECT_EQ(Testing::TakeBitmap(section.Release()).bits, 24);
}

TEST(DibSection, ASizeThatIsNoBitmapGivesNull) {
  DibSection section;
  section.CreateGrey(0, 0);
  EXPECT_EQ(section.Bits().data, nullptr);
  EXPECT_EQ(section.Release(), nullptr);
  section.CreateGrey(-4, 3);
  EXPECT_EQ(section.Release(), nullptr);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
