// From the pixels of a frame to a bitmap, a piece at a time.
//
// A FrameRenderer is made for one frame and one request, is given the frame's pixels in pieces and keeps
// nothing of the frame but its reduced image. The frame reader (formats/frame_reader.h) uses it to stream
// frames of any size; the Render... functions give it a frame that is in memory as a single piece.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <memory>

#include "image_view.h"
#include "pixel_type.h"
#include "reduction.h"

namespace Qel::Lumetra::ShellExt {

/// A rectangle of a frame's pixels in memory, of the pixel type that its receiver was made for.
struct FramePiece {
  std::int32_t x = 0;  // place in the frame of the first pixel, in picture coordinates (row 0 is the top)
  std::int32_t y = 0;
  ImageView<const std::byte> pixels;
};

class FrameRenderer {
 public:
  virtual ~FrameRenderer() = default;

  /// How the frame is reduced. Only the pixels of whole blocks are wanted: the first
  /// size.width * factor columns of the first size.height * factor rows.
  virtual const Reduction& reduction() const = 0;

  /// Takes a piece of the whole blocks. Pieces come in any order as long as the pixels of each block come
  /// row by row and left to right, and a row of blocks is complete before another begins in its columns.
  virtual void Add(const FramePiece& piece) = 0;

  /// The bitmap, owned by the caller; null when the system does not make one of this size.
  virtual HBITMAP Finish() = 0;
};

/// Makes the renderer for a frame of this size and type of pixel; null for a pixel that cannot be rendered.
/// Faults for a request that cannot be divided by (reduction.h); throws std::bad_alloc when there is no
/// memory for the reduced image.
std::unique_ptr<FrameRenderer> MakeFrameRenderer(PixelTag pixel, Size2 frame, const SIZE& request);

/// A grey bitmap of 8 bits a pixel of a frame of one of the eight scalar types: the box average, its own
/// range of values stretched linearly to 0..255.
template <class T>
HBITMAP RenderGreyThumbnail(const ImageView<const T>& frame, const SIZE& request);

/// The grey bitmap of ln(re² + im²) of every pixel, for complex pixels of int16, float or double parts.
template <class T>
HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<T>>& frame, const SIZE& request);

/// A bitmap of 24 bits a pixel: the box average of each channel, values not stretched.
template <ColourOrder kOrder>
HBITMAP RenderColourThumbnail(const ImageView<const ColourPixel<kOrder>>& frame, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
