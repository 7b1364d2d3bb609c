// The box average of a frame that is in memory as a whole.
#pragma once

#include <cstdint>

#include "box_reducer.h"
#include "dib_section.h"
#include "image_view.h"
#include "pixel.h"

namespace Qel::Lumetra::ShellExt {

/// Writes the average of every whole block of `factor` by `factor` pixels of `source` into `target`, which
/// has the size of the source divided by the factor. What is left over at the right and bottom is dropped.
template <class Pixel, class TargetView>
void DownsampleBox(const ImageView<const Pixel>& source, std::int32_t factor, const TargetView& target) {
  BoxReducer<Pixel, TargetView> reducer(factor, target);
  reducer.Add(source.Part(0, 0, target.width * factor, target.height * factor), 0, 0);
}

/// The same for colours, each channel by itself, into the bits of a bitmap: red-first pixels have their
/// first and third channel swapped, blue-first pixels are kept in order.
template <ColourOrder kOrder>
void DownsampleBoxRgb(const ImageView<const ColourPixel<kOrder>>& source, std::int32_t factor,
                      const ImageView<std::uint8_t>& bits) {
  DownsampleBox(source, factor, AsBgrPixels(bits));
}

}  // namespace Qel::Lumetra::ShellExt
