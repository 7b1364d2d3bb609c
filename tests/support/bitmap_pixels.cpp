#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt::Testing {

BitmapPixels TakeBitmap(HBITMAP bitmap) {
  BitmapPixels pixels;
  DIBSECTION section{};
  if (bitmap == nullptr || GetObjectW(bitmap, sizeof section, &section) != static_cast<int>(sizeof section)) {
    return pixels;
  }
  pixels.width = section.dsBm.bmWidth;
  pixels.height = section.dsBm.bmHeight;
  pixels.bits = section.dsBm.bmBitsPixel;
  pixels.rowBytes = section.dsBm.bmWidthBytes;
  const auto* row = static_cast<const std::uint8_t*>(section.dsBm.bmBits);
  const std::int32_t usedBytes = pixels.width * (pixels.bits / 8);
  for (std::int32_t y = 0; y < pixels.height; ++y, row += pixels.rowBytes) {
    pixels.bytes.insert(pixels.bytes.end(), row, row + usedBytes);
  }
  if (pixels.bits == 8) {
    const HDC dc = CreateCompatibleDC(nullptr);
    const HGDIOBJ previous = SelectObject(dc, bitmap);
    pixels.colours.resize(256);
    pixels.colours.resize(GetDIBColorTable(dc, 0, 256, pixels.colours.data()));
    SelectObject(dc, previous);
    DeleteDC(dc);
  }
  DeleteObject(bitmap);
  return pixels;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
