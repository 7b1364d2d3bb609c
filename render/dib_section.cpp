#include "dib_section.h"

#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr int kGreyLevels = 256;
constexpr LONG kPixelsPerMetre = 1200;

// A BITMAPINFO with room for a whole colour table.
struct BitmapInfo {
  BITMAPINFOHEADER header;
  RGBQUAD colours[kGreyLevels];
};
static_assert(sizeof(BitmapInfo) == 40 + 256 * 4);

}  // namespace

std::int64_t BitmapRowStride(std::int32_t width, std::int32_t bytesPerPixel) {
  return (std::int64_t{width} * bytesPerPixel + 3) & ~std::int64_t{3};
}

BITMAPINFOHEADER BitmapHeader(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel) {
  const std::int64_t rowBytes = std::int64_t{width} * bytesPerPixel;
  BITMAPINFOHEADER header{};
  header.biSize = sizeof header;
  header.biWidth = width;
  header.biHeight = WrapToInt32(-std::int64_t{height});  // negative: top-down
  header.biPlanes = 1;
  header.biBitCount = static_cast<WORD>(8 * bytesPerPixel);
  header.biCompression = BI_RGB;
  // The size omits the padding of the last row.
  header.biSizeImage =
      static_cast<DWORD>((height - std::int64_t{1}) * BitmapRowStride(width, bytesPerPixel) + rowBytes);
  header.biXPelsPerMeter = kPixelsPerMetre;
  header.biYPelsPerMeter = kPixelsPerMetre;
  header.biClrUsed = bytesPerPixel == 1 ? kGreyLevels : 0;
  return header;
}

void DibSection::Create(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel) {
  BitmapInfo info{BitmapHeader(width, height, bytesPerPixel), {}};
  for (DWORD level = 0; level < info.header.biClrUsed; ++level) {
    const auto value = static_cast<BYTE>(level);
    info.colours[level] = {value, value, value, 0};
  }

  const HDC dc = CreateCompatibleDC(nullptr);
  void* bits = nullptr;
  Replace(
      CreateDIBSection(dc, reinterpret_cast<const BITMAPINFO*>(&info), DIB_RGB_COLORS, &bits, nullptr, 0));
  bits_ = {width, height, static_cast<std::uint8_t*>(bits), bytesPerPixel,
           BitmapRowStride(width, bytesPerPixel)};
  DeleteDC(dc);
}

void DibSection::Replace(HBITMAP bitmap) {
  if (bitmap_ != nullptr) DeleteObject(bitmap_);
  bitmap_ = bitmap;
}

}  // namespace Qel::Lumetra::ShellExt
