#include "frame_layout.h"

#include "wrap.h"

namespace Qel::Lumetra::ShellExt {

FrameLayout PackedLayout(const PixelType& type, Size2 size, std::int64_t position) {
  const std::int64_t pixelBytes = type.bytes();
  // The formats count a frame's pixels in 32 bits. A count that wraps leaves pixels outside the block.
  const std::int64_t pixels = WrappingProduct(size.width, size.height);
  return {.type = type,
          .size = size,
          .blockPosition = position,
          .blockBytes = pixels * pixelBytes,
          .pixelStride = pixelBytes,
          .rowStride = size.width * pixelBytes};
}

FrameLayout FlippedVertically(const FrameLayout& layout) {
  FrameLayout flipped = layout;
  flipped.firstPixel = layout.blockBytes - layout.rowStride;  // height * rowStride may not fit in 64 bits
  flipped.rowStride = -layout.rowStride;
  return flipped;
}

}  // namespace Qel::Lumetra::ShellExt
