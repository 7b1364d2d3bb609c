#include "reduction.h"

#include <algorithm>

#include "divide.h"

namespace Qel::Lumetra::ShellExt {
namespace {

std::int32_t LargerRatio(Size2 frame, const SIZE& request) {
  return std::max(DivideOrFault(frame.width, request.cx), DivideOrFault(frame.height, request.cy));
}

Reduction ReductionBy(std::int32_t factor, Size2 frame) {
  return {factor, {DivideOrFault(frame.width, factor), DivideOrFault(frame.height, factor)}};
}

}  // namespace

Reduction GreyReduction(Size2 frame, const SIZE& request) {
  return ReductionBy(std::max(LargerRatio(frame, request), 1), frame);
}

Reduction ColourReduction(Size2 frame, const SIZE& request) {
  return ReductionBy(LargerRatio(frame, request), frame);
}

}  // namespace Qel::Lumetra::ShellExt
