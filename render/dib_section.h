// Owns one device-independent bitmap until it is handed out.
#pragma once

#include <windows.h>

#include <cstdint>
#include <utility>

#include "image_view.h"

namespace Qel::Lumetra::ShellExt {

/// Returns the number of bytes from the start of one row of a bitmap to the start of the next.
std::int64_t BitmapRowStride(std::int32_t width, std::int32_t bytesPerPixel);

/// Returns the header of a top-down bitmap of 1 (grey) or 3 (colour) bytes per pixel, with rows padded to 4
/// bytes.
BITMAPINFOHEADER BitmapHeader(std::int32_t width, std::int32_t height, std::int32_t bytesPerPixel);

/// Holds a top-down bitmap (row 0 is the top row, rows padded to 4 bytes) until Release hands it out; deletes
/// it otherwise. If the system cannot create the bitmap, the handle and the bits are null.
class DibSection {
 public:
  DibSection() = default;
  ~DibSection() { Replace(nullptr); }
  DibSection(const DibSection&) = delete;
  DibSection& operator=(const DibSection&) = delete;

  /// Creates a bitmap of 8 bits per pixel with a linear grey ramp of 256 colours.
  void CreateGrey(std::int32_t width, std::int32_t height) { Create(width, height, 1); }

  /// Creates a bitmap of 24 bits per pixel, blue first, without a colour table.
  void CreateColour(std::int32_t width, std::int32_t height) { Create(width, height, 3); }

  const ImageView<std::uint8_t>& Bits() const { return bits_; }

  /// Hands the bitmap over to the caller and leaves this object empty.
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
