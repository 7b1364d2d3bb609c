// By how much a frame is reduced: one integer factor for both dimensions, so that the aspect ratio stays.
#pragma once

#include <windows.h>

#include <cstdint>

#include "size2.h"

namespace Qel::Lumetra::ShellExt {

struct Reduction {
  std::int32_t factor = 1;  // edge of the square block of pixels that becomes one
  Size2 size;               // of the reduced frame; what is left over at the right and the bottom is dropped
};

/// For grey frames: never enlarges, the factor is at least 1. Because the factor is truncated, the result
/// can be up to nearly twice the requested size. A request of 0 faults (divide.h).
Reduction GreyReduction(Size2 frame, const SIZE& request);

/// For colour frames: as GreyReduction, but the factor is not raised to 1, so that a frame smaller than the
/// request in both dimensions faults (divide.h). The difference between the two is intended.
Reduction ColourReduction(Size2 frame, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
