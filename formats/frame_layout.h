// Where the pixels of one frame lie in a file: all that a file kind has to say for a thumbnail.
#pragma once

#include <cstdint>

#include "pixel_type.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt {

/// The pixel at column x of the picture's row y (row 0 is the top) begins at file offset
/// blockPosition + firstPixel + x * pixelStride + y * rowStride. All bytes of the frame lie in the
/// blockBytes bytes from blockPosition; a layout with a pixel outside of them cannot be read.
struct FrameLayout {
  PixelType type;
  Size2 size;
  std::int64_t blockPosition = 0;
  std::int64_t blockBytes = 0;
  std::int64_t firstPixel = 0;
  std::int64_t pixelStride = 0;
  std::int64_t rowStride = 0;
  bool swapBytes = false;  // 16-bit pixels with the high byte first
};

/// Rows one after the other without padding, from the top, beginning at file offset `position`.
FrameLayout PackedLayout(const PixelType& type, Size2 size, std::int64_t position);

/// The same rows, the first of them at the bottom of the picture.
FrameLayout FlippedVertically(const FrameLayout& layout);

}  // namespace Qel::Lumetra::ShellExt
