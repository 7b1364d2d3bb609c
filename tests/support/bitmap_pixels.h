// Reads the pixels of a bitmap back from its handle.
#pragma once

#include <windows.h>

#include <cstdint>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

struct BitmapPixels {
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t bits = 0;            // per pixel
  std::int32_t rowBytes = 0;        // with padding
  std::vector<std::uint8_t> bytes;  // all rows from the top, without padding
  std::vector<RGBQUAD> colours;     // the colour table; empty without one

  friend bool operator==(const BitmapPixels& a, const BitmapPixels& b) {
    return a.width == b.width && a.height == b.height && a.bits == b.bits && a.bytes == b.bytes;
  }
};

/// Reads `bitmap`, which must be a DIB section, and deletes it. Returns an empty result for null.
BitmapPixels TakeBitmap(HBITMAP bitmap);

}  // namespace Qel::Lumetra::ShellExt::Testing
