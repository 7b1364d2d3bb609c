// The reduction of a frame by one integer factor in both dimensions, which keeps the aspect ratio.
#pragma once

#include <windows.h>

#include <cstdint>

#include "size2.h"

namespace Qel::Lumetra::ShellExt {

struct Reduction {
  std::int32_t factor = 1;  // edge of the square block of pixels that becomes one
  Size2 size;               // of the reduced frame, without the remainder at the right and the bottom

  /// Returns whether the frame has a whole block. It has none if it is too narrow or too short for the
  /// factor, or if the request or the frame's own size is negative.
  bool HasBlocks() const { return factor > 0 && size.width > 0 && size.height > 0; }

  /// Returns the columns and rows of the frame that lie in whole blocks, counted from its left and its top.
  /// Only for a frame that has whole blocks.
  Size2 Covered() const { return {size.width * factor, size.height * factor}; }
};

/// Returns the reduction of grey frames, which never enlarges: the factor is at least 1. Because the factor
/// is truncated, the result can be nearly twice the requested size. A request of 0 ends the process
/// (divide.h).
Reduction GreyReduction(Size2 frame, const SIZE& request);

/// Returns the reduction of colour frames. Unlike GreyReduction it does not raise the factor to 1, so a frame
/// smaller than the request in both dimensions ends the process (divide.h). The difference is intentional.
Reduction ColourReduction(Size2 frame, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
