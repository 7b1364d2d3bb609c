// Turns the pixels of a frame into a bitmap, one piece at a time.
//
// A FrameRenderer is made for one frame and one request. It receives the frame's pixels in pieces and keeps
// only the reduced image. The frame reader (formats/frame_reader.h) streams frames of any size through it;
// whole_frame.h gives it a whole frame that is already in memory.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <memory>

#include "image_view.h"
#include "pixel_type.h"
#include "reduction.h"

namespace Qel::Lumetra::ShellExt {

/// A rectangle of a frame's pixels in memory, of the pixel type that the renderer was made for.
struct FramePiece {
  std::int32_t x = 0;  // position of the first pixel in the frame, whose row 0 is the top
  std::int32_t y = 0;
  ImageView<const std::byte> pixels;
};

class FrameRenderer {
 public:
  virtual ~FrameRenderer() = default;

  /// Returns how the frame is reduced. The renderer takes only the pixels of whole blocks,
  /// Reduction::Covered.
  virtual const Reduction& reduction() const = 0;

  /// Adds a piece of the whole blocks. Pieces may arrive in any order as long as the pixels of each block
  /// arrive row by row and left to right, and a row of blocks is complete before another begins in the same
  /// columns.
  virtual void Add(const FramePiece& piece) = 0;

  /// Returns the bitmap, owned by the caller; null if the system cannot create one of this size.
  virtual HBITMAP Finish() = 0;
};

/// Makes the renderer for a frame of this size and pixel type; returns null for pixels that cannot be
/// rendered. A request that leads to a division by zero ends the process (reduction.h). Throws std::bad_alloc
/// if there is no memory for the reduced image.
std::unique_ptr<FrameRenderer> MakeFrameRenderer(PixelTag pixel, Size2 frame, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
