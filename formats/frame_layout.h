// Where the pixels of one frame lie in a file: all that a file kind has to say for a thumbnail.
#pragma once

#include <cstdint>
#include <optional>

#include "data_type.h"
#include "pixel.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt {

/// The pixel at column x of the picture's row y (row 0 is the top) begins at file offset
/// blockPosition + firstPixel + x * pixelStride + y * rowStride. All bytes of the frame lie in the
/// blockBytes bytes from blockPosition; a layout with a pixel outside of them cannot be read.
struct FrameLayout {
  PixelFormat format = PixelFormat::kUInt8;
  Size2 size;
  std::int64_t blockPosition = 0;
  std::int64_t blockBytes = 0;
  std::int64_t firstPixel = 0;
  std::int64_t pixelStride = 0;
  std::int64_t rowStride = 0;
  bool swapBytes = false;  // 16-bit pixels with the high byte first
};

/// The stored form of pixels of a shared type; none for a type that is unknown.
std::optional<PixelFormat> PixelFormatOf(DataType type);

/// Rows one after the other without padding, from the top, beginning at file offset `position`.
FrameLayout PackedLayout(PixelFormat format, Size2 size, std::int64_t position);

/// The same rows, the first of them at the bottom of the picture.
FrameLayout FlippedVertically(const FrameLayout& layout);

}  // namespace Qel::Lumetra::ShellExt
