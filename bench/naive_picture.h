// The picture that a file should have, from the naive reference of the tests.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>

#include "bitmap_pixels.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt::Bench {

/// Where a frame's pixels lie, told by who wrote the file: row 0 is the top of the picture, offsets in bytes
/// from the start of the file.
struct PixelPlaces {
  std::string pixel;  // name of the pixel type: "uint8", "float32", "complex64", "rgb"...
  Size2 size;
  std::int64_t firstPixel = 0;
  std::int64_t pixelStride = 0;
  std::int64_t rowStride = 0;
};

/// Empty for a file that cannot be read; throws std::runtime_error for an unknown name of a pixel type.
Testing::BitmapPixels NaivePicture(const std::wstring& path, const PixelPlaces& places, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt::Bench
