// Tests where the POSIX stand-in must fail as Windows does. The tests of the layers above cover the rest of
// it.
#include <gtest/gtest.h>
#include <windows.h>

#include <limits>

namespace {

HBITMAP MakeBitmap(LONG width, LONG height, WORD bits, void** bytes) {
  BITMAPINFO info{};
  info.bmiHeader.biSize = sizeof info.bmiHeader;
  info.bmiHeader.biWidth = width;
  info.bmiHeader.biHeight = height;
  info.bmiHeader.biPlanes = 1;
  info.bmiHeader.biBitCount = bits;
  return CreateDIBSection(nullptr, &info, DIB_RGB_COLORS, bytes, nullptr, 0);
}

TEST(Posix, MakesNoBitmapWithoutPixels) {
  EXPECT_EQ(MakeBitmap(0, 1, 8, nullptr), nullptr);
  EXPECT_EQ(MakeBitmap(-1, 1, 8, nullptr), nullptr);
  EXPECT_EQ(MakeBitmap(1, 0, 8, nullptr), nullptr);
}

TEST(Posix, MakesNoBitmapWhoseSizeExceeds32Bits) {
  constexpr LONG kMax = std::numeric_limits<LONG>::max();
  constexpr LONG kMin = std::numeric_limits<LONG>::min();
  void* bytes = &bytes;
  EXPECT_EQ(MakeBitmap(65536, 65536, 8, &bytes), nullptr);
  EXPECT_EQ(bytes, nullptr);
  EXPECT_EQ(MakeBitmap(kMax, kMax, 24, &bytes), nullptr);
  EXPECT_EQ(MakeBitmap(kMax, kMin, 24, &bytes), nullptr);
}

TEST(Posix, DescribesNoBitmapForNull) {
  BITMAP bitmap{};
  EXPECT_EQ(GetObjectW(nullptr, sizeof bitmap, &bitmap), 0);
  EXPECT_TRUE(DeleteObject(nullptr));
}

TEST(Posix, OpensNoFileWhoseNameHasNoEncoding) {
  const wchar_t name[] = {static_cast<wchar_t>(0x110000), L'\0'};
  EXPECT_EQ(CreateFileW(name, GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL,
                        nullptr),
            INVALID_HANDLE_VALUE);
}

}  // namespace
