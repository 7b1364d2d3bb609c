// Where the pixels of one frame are in a file: everything that a thumbnail needs from a file kind.
#pragma once

#include <cstdint>

#include "pixel_type.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt {

/// The pixel at column x of the frame's row y (row 0 is the top) begins at file offset
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

/// Returns the layout of a frame without padding, whose rows begin at file offset `position`, top row first.
FrameLayout PackedLayout(const PixelType& type, Size2 size, std::int64_t position);

/// Returns the layout of the same packed rows in reverse order: the first stored row is at the bottom of the
/// frame.
FrameLayout FlippedVertically(const FrameLayout& layout);

}  // namespace Qel::Lumetra::ShellExt
