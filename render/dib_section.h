// The owner of one device-independent bitmap while it is made.
#pragma once

#include <windows.h>

#include <cstdint>
#include <utility>

#include "image_view.h"
#include "pixel.h"

namespace Qel::Lumetra::ShellExt {

/// The bits of a 24-bit bitmap as pixels.
inline ImageView<BgrPixel> AsBgrPixels(const ImageView<std::uint8_t>& bits) {
  return {bits.width, bits.height, reinterpret_cast<BgrPixel*>(bits.data), bits.pixelStride, bits.rowStride};
}

/// Bytes from a row of a bitmap to the next.
std::int64_t BitmapRowStride(std::int32_t width, std::int32_t bytesPerPixel);

/// The header of a top-down bitmap of 1 (grey) or 3 (colour) bytes a pixel, rows padded to 4 bytes.
BITMAPINFOHEADER BitmapHeader(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel);

/// Holds a top-down bitmap (row 0 is the top row, rows padded to 4 bytes) until it is handed out by
/// Release; deletes it otherwise. When the system does not make the bitmap, the handle and the bits are null.
class DibSection {
 public:
  DibSection() = default;
  ~DibSection() { Replace(nullptr); }
  DibSection(const DibSection&) = delete;
  DibSection& operator=(const DibSection&) = delete;

  /// A bitmap of 8 bits a pixel with a linear grey ramp of 256 colours.
  void CreateGrey(std::int32_t width, std::int32_t height) { Create(width, height, 1); }

  /// A bitmap of 24 bits a pixel, blue first, without colour table.
  void CreateColour(std::int32_t width, std::int32_t height) { Create(width, height, 3); }

  const ImageView<std::uint8_t>& Bits() const { return bits_; }

  /// The bitmap, which is the caller's from now on; leaves this object empty.
  HBITMAP Release() {
    bits_ = {};
    return std::exchange(bitmap_, nullptr);
  }

 private:
  void Create(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel);
  void Replace(HBITMAP bitmap);

  HBITMAP bitmap_ = nullptr;
  ImageView<std::uint8_t> bits_;
};

}  // namespace Qel::Lumetra::ShellExt
