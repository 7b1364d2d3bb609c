#include "dib_section.h"

#include <gtest/gtest.h>

#include <cstring>

#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(DibSection, GreyBitsHaveOneBytePerPixel) {
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
}

TEST(DibSection, HoldsTheHandleAndThenTheViewOfItsBits) {
  DibSection section;
  section.CreateColour(5, 3);
  struct {
    HBITMAP bitmap;
    ImageView<std::uint8_t> bits;
  } fields;
  static_assert(sizeof fields == sizeof(DibSection));
  // NOLINTNEXTLINE(bugprone-undefined-memory-manipulation): the test reads the memory layout
  std::memcpy(static_cast<void*>(&fields), &section, sizeof fields);
  EXPECT_EQ(fields.bits.width, 5);
  EXPECT_EQ(fields.bits.height, 3);
  EXPECT_EQ(fields.bits.data, section.Bits().data);
  const HBITMAP bitmap = section.Release();
  EXPECT_EQ(fields.bitmap, bitmap);
  DeleteObject(bitmap);
}

TEST(DibSection, HeaderIsTopDown) {
  const BITMAPINFOHEADER grey = BitmapHeader(5, 3, 1);
  EXPECT_EQ(grey.biSize, 40u);
  EXPECT_EQ(grey.biWidth, 5);
  EXPECT_EQ(grey.biHeight, -3);
  EXPECT_EQ(grey.biPlanes, 1);
  EXPECT_EQ(grey.biBitCount, 8);
  EXPECT_EQ(grey.biCompression, BI_RGB);
  EXPECT_EQ(grey.biSizeImage, 2u * 8u + 5u);
  EXPECT_EQ(grey.biXPelsPerMeter, 1200);
  EXPECT_EQ(grey.biYPelsPerMeter, 1200);
  EXPECT_EQ(grey.biClrUsed, 256u);
  EXPECT_EQ(grey.biClrImportant, 0u);
  const BITMAPINFOHEADER colour = BitmapHeader(3, 2, 3);
  EXPECT_EQ(colour.biBitCount, 24);
  EXPECT_EQ(colour.biSizeImage, 12u + 9u);
  EXPECT_EQ(colour.biClrUsed, 0u);
}

TEST(DibSection, ColourBitsHaveThreeBytesPerPixel) {
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

TEST(DibSection, InvalidSizeGivesNull) {
  DibSection section;
  section.CreateGrey(0, 0);
  EXPECT_EQ(section.Bits().data, nullptr);
  EXPECT_EQ(section.Release(), nullptr);
  section.CreateGrey(-4, 3);
  EXPECT_EQ(section.Release(), nullptr);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
