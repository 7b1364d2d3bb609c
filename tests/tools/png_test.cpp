// Writes bitmaps as PNG files and reads them back with the decoder of Windows.
#include "png.h"

#include <gtest/gtest.h>
#include <windows.h>

#include <shlwapi.h>
#include <wincodec.h>

#include <cstdint>
#include <random>
#include <vector>

#include "bitmap_pixels.h"
#include "com_ptr.h"
#include "dib_section.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::ComPtr;

class Png : public testing::Test {
 protected:
  Png() { CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED); }
  ~Png() override { CoUninitialize(); }

  /// Returns the pixels that the decoder of Windows reads, converted to `format`.
  static std::vector<std::uint8_t> Decode(const std::vector<std::uint8_t>& png, const GUID& format,
                                          UINT bytesPerPixel) {
    ComPtr<IStream> stream;
    *stream.Put() = SHCreateMemStream(png.data(), static_cast<UINT>(png.size()));
    ComPtr<IWICImagingFactory> factory;
    EXPECT_EQ(CoCreateInstance(CLSID_WICImagingFactory, nullptr, CLSCTX_INPROC_SERVER, IID_IWICImagingFactory,
                               reinterpret_cast<void**>(factory.Put())),
              S_OK);
    ComPtr<IWICBitmapDecoder> decoder;
    EXPECT_EQ(factory->CreateDecoderFromStream(stream.Get(), nullptr, WICDecodeMetadataCacheOnDemand,
                                               decoder.Put()),
              S_OK);
    ComPtr<IWICBitmapFrameDecode> frame;
    EXPECT_EQ(decoder->GetFrame(0, frame.Put()), S_OK);
    WICPixelFormatGUID found{};
    EXPECT_EQ(frame->GetPixelFormat(&found), S_OK);
    EXPECT_TRUE(IsEqualGUID(found, format));
    UINT width = 0;
    UINT height = 0;
    EXPECT_EQ(frame->GetSize(&width, &height), S_OK);
    std::vector<std::uint8_t> pixels(std::size_t{width} * height * bytesPerPixel);
    EXPECT_EQ(
        frame->CopyPixels(nullptr, width * bytesPerPixel, static_cast<UINT>(pixels.size()), pixels.data()),
        S_OK);
    return pixels;
  }

  static void FillRandomly(const ImageView<std::uint8_t>& bits) {
    std::mt19937 random(7);
    for (std::int32_t y = 0; y < bits.height; ++y) {
      for (std::int64_t i = 0; i < bits.width * bits.pixelStride; ++i) {
        bits.data[y * bits.rowStride + i] = static_cast<std::uint8_t>(random());
      }
    }
  }
};

TEST_F(Png, OfAGreyBitmapHoldsItsPixels) {
  // At most of these widths a bitmap's rows are padded; at one they are not.
  for (const std::int32_t width : {1, 2, 3, 64, 333}) {
    DibSection section;
    section.CreateGrey(width, 57);
    FillRandomly(section.Bits());
    const HBITMAP bitmap = section.Release();
    std::vector<std::uint8_t> png;
    ASSERT_EQ(EncodePng(bitmap, png), S_OK);
    EXPECT_EQ(Decode(png, GUID_WICPixelFormat8bppGray, 1), Testing::TakeBitmap(bitmap).bytes) << width;
  }
}

TEST_F(Png, OfAColourBitmapHoldsItsPixels) {
  for (const std::int32_t width : {1, 2, 3, 64, 333}) {
    DibSection section;
    section.CreateColour(width, 57);
    FillRandomly(section.Bits());
    const HBITMAP bitmap = section.Release();
    std::vector<std::uint8_t> png;
    ASSERT_EQ(EncodePng(bitmap, png), S_OK);
    EXPECT_EQ(Decode(png, GUID_WICPixelFormat24bppBGR, 3), Testing::TakeBitmap(bitmap).bytes) << width;
  }
}

TEST_F(Png, IsNotMadeOfANullBitmap) {
  std::vector<std::uint8_t> png = {1};
  EXPECT_EQ(EncodePng(nullptr, png), E_INVALIDARG);
  EXPECT_TRUE(png.empty());
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show
