// Where the pixels of one frame are in a file: all that a thumbnail needs from a file kind.
#pragma once

#include <cstdint>

#include "pixel_type.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt {

/// The pixel at column x of the picture's row y (row 0 is the top) begins at file offset
/// blockPosition + firstPixel + x * pixelStride + y * rowStride. All bytes of the frame are in the
/// blockBytes bytes from blockPosition; a layout with a pixel outside them cannot be read.
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

/// Returns the layout of rows without padding, from the top, that begin at file offset `position`.
FrameLayout PackedLayout(const PixelType& type, Size2 size, std::int64_t position);

/// Returns the layout of the same packed rows with the first one at the bottom of the picture.
FrameLayout FlippedVertically(const FrameLayout& layout);

}  // namespace Qel::Lumetra::ShellExt
