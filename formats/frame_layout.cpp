#include "frame_layout.h"

#include "wrap.h"

namespace Qel::Lumetra::ShellExt {

std::optional<PixelFormat> PixelFormatOf(DataType type) {
  switch (type) {
    case DataType::kUInt8: return PixelFormat::kUInt8;
    case DataType::kUInt16: return PixelFormat::kUInt16;
    case DataType::kUInt32: return PixelFormat::kUInt32;
    case DataType::kInt8: return PixelFormat::kInt8;
    case DataType::kInt16: return PixelFormat::kInt16;
    case DataType::kInt32: return PixelFormat::kInt32;
    case DataType::kFloat32: return PixelFormat::kFloat32;
    case DataType::kFloat64: return PixelFormat::kFloat64;
    case DataType::kComplexFloat32: return PixelFormat::kComplexFloat32;
    case DataType::kComplexFloat64: return PixelFormat::kComplexFloat64;
    case DataType::kRgb24: return PixelFormat::kRgb24;
    case DataType::kBgr24: return PixelFormat::kBgr24;
  }
  return std::nullopt;
}

FrameLayout PackedLayout(PixelFormat format, Size2 size, std::int64_t position) {
  const std::int64_t pixelBytes = BytesPerPixel(format);
  // The formats count a frame's pixels in 32 bits. A count that wraps leaves pixels outside of the block.
  const std::int64_t pixels = WrappingProduct(size.width, size.height);
  return {.format = format,
          .size = size,
          .blockPosition = position,
          .blockBytes = pixels * pixelBytes,
          .pixelStride = pixelBytes,
          .rowStride = size.width * pixelBytes};
}

FrameLayout FlippedVertically(const FrameLayout& layout) {
  FrameLayout flipped = layout;
  flipped.firstPixel += (layout.size.height - std::int64_t{1}) * layout.rowStride;
  flipped.rowStride = -layout.rowStride;
  return flipped;
}

}  // namespace Qel::Lumetra::ShellExt
