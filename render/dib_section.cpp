#include "dib_section.h"

#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr int kGreyLevels = 256;
constexpr LONG kPixelsPerMetre = 1200;

// BITMAPINFO with room for a whole colour table.
struct BitmapInfo {
  BITMAPINFOHEADER header;
  RGBQUAD colours[kGreyLevels];
};
static_assert(sizeof(BitmapInfo) == 40 + 256 * 4);

}  // namespace

void DibSection::Create(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel) {
  const bool grey = bytesPerPixel == 1;
  const std::int64_t rowBytes = std::int64_t{width} * bytesPerPixel;
  const std::int64_t stride = (rowBytes + 3) & ~std::int64_t{3};

  BitmapInfo info{};
  info.header.biSize = sizeof info.header;
  info.header.biWidth = width;
  info.header.biHeight = WrapToInt32(-std::int64_t{height});  // negative: top-down
  info.header.biPlanes = 1;
  info.header.biBitCount = static_cast<WORD>(8 * bytesPerPixel);
  info.header.biCompression = BI_RGB;
  info.header.biSizeImage = static_cast<DWORD>((height - std::int64_t{1}) * stride + rowBytes);
  info.header.biXPelsPerMeter = kPixelsPerMetre;
  info.header.biYPelsPerMeter = kPixelsPerMetre;
  info.header.biClrUsed = grey ? kGreyLevels : 0;
  for (int level = 0; grey && level < kGreyLevels; ++level) {
    const auto value = static_cast<BYTE>(level);
    info.colours[level] = {value, value, value, 0};
  }

  const HDC dc = CreateCompatibleDC(nullptr);
  void* bits = nullptr;
  Replace(
      CreateDIBSection(dc, reinterpret_cast<const BITMAPINFO*>(&info), DIB_RGB_COLORS, &bits, nullptr, 0));
  bits_ = {width, height, static_cast<std::uint8_t*>(bits), bytesPerPixel, stride};
  DeleteDC(dc);
}

void DibSection::Replace(HBITMAP bitmap) {
  if (bitmap_ != nullptr) DeleteObject(bitmap_);
  bitmap_ = bitmap;
}

}  // namespace Qel::Lumetra::ShellExt
