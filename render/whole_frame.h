// Renders a whole frame that is already in memory, as a single piece. The file readers stream their frames
// (formats/frame_reader.h) and do not need these functions.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "box_reducer.h"
#include "frame_renderer.h"
#include "image_view.h"
#include "pixel.h"
#include "reduction.h"

namespace Qel::Lumetra::ShellExt {

/// Returns the bitmap that the renderer of MakeFrameRenderer makes of `frame`. Ends the process or throws as
/// MakeFrameRenderer does.
template <class Pixel>
HBITMAP RenderThumbnail(const ImageView<const Pixel>& frame, const SIZE& request) {
  const auto renderer = MakeFrameRenderer(std::type_identity<Pixel>(), {frame.width, frame.height}, request);
  const Reduction& reduction = renderer->reduction();
  if (reduction.HasBlocks()) {
    const Size2 covered = reduction.Covered();
    renderer->Add({0, 0, ViewAs<const std::byte>(frame.Part(0, 0, covered.width, covered.height))});
  }
  return renderer->Finish();
}

/// Returns the grey bitmap, 8 bits per pixel, of a frame of one of the eight scalar types: the box average,
/// with its own range of values stretched linearly to 0..255.
template <class T>
HBITMAP RenderGreyThumbnail(const ImageView<const T>& frame, const SIZE& request) {
  return RenderThumbnail(frame, request);
}

/// Returns the grey bitmap of ln(re² + im²) of every pixel, for complex pixels of int16, float or double
/// parts.
template <class T>
HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<T>>& frame, const SIZE& request) {
  return RenderThumbnail(frame, request);
}

/// Returns the bitmap, 24 bits per pixel, of the box average of each channel. The values are not stretched.
template <ColourOrder kOrder>
HBITMAP RenderColourThumbnail(const ImageView<const ColourPixel<kOrder>>& frame, const SIZE& request) {
  return RenderThumbnail(frame, request);
}

/// Writes the average of every whole block of `factor` by `factor` pixels of `source` into `target`, which
/// has the size of the source divided by the factor and no gaps between the pixels of a row. The remainder at
/// the right and the bottom is dropped. Writes nothing for a factor below 1.
template <class Pixel>
void DownsampleBox(const ImageView<const Pixel>& source, std::int32_t factor,
                   const ImageView<typename SamplesOf<Pixel>::Target>& target) {
  const Reduction reduction{factor, {target.width, target.height}};
  if (!reduction.HasBlocks()) return;
  const Size2 covered = reduction.Covered();
  BoxReducer<Pixel>(factor, target).Add(source.Part(0, 0, covered.width, covered.height), 0, 0);
}

/// Averages each colour channel by itself into the bits of a bitmap: red-first pixels have their first and
/// third channel swapped, blue-first pixels keep their order.
template <ColourOrder kOrder>
void DownsampleBoxRgb(const ImageView<const ColourPixel<kOrder>>& source, std::int32_t factor,
                      const ImageView<std::uint8_t>& bits) {
  DownsampleBox(source, factor, ViewAs<BgrPixel>(bits));
}

}  // namespace Qel::Lumetra::ShellExt
