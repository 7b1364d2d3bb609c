#include "frame_renderer.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <optional>

#include "box_reducer.h"
#include "dib_section.h"
#include "downsample_box.h"
#include "grey_image.h"
#include "logarithm.h"

namespace Qel::Lumetra::ShellExt {
namespace {

template <class T>
ImageView<const T> As(const ImageView<const std::byte>& bytes) {
  return {bytes.width, bytes.height, reinterpret_cast<const T*>(bytes.data), bytes.pixelStride,
          bytes.rowStride};
}

/// A size without any pixel, or without any that a bitmap could have.
bool IsEmpty(const Reduction& reduction) {
  return reduction.size.width < 1 || reduction.size.height < 1;
}

template <class T>
class GreyRenderer final : public FrameRenderer {
 public:
  GreyRenderer(Size2 frame, const SIZE& request)
      : reduction_(GreyReduction(frame, request)), image_(reduction_.size) {
    if (!image_.empty()) reducer_.emplace(reduction_.factor, image_.view());
  }

  const Reduction& reduction() const override { return reduction_; }

  void Add(const FramePiece& piece) override { Add(As<T>(piece.pixels), piece.x, piece.y); }

  void Add(const ImageView<const T>& pixels, std::int32_t x, std::int32_t y) {
    if (reducer_) reducer_->Add(pixels, x, y);
  }

  HBITMAP Finish() override { return image_.ToBitmap(); }

 private:
  Reduction reduction_;
  GreyImage<T> image_;
  std::optional<BoxReducer<T, SplitView<T>>> reducer_;
};

/// Turns every complex pixel into the logarithm of its squared magnitude, which is then a float frame.
template <class T>
class ComplexRenderer final : public FrameRenderer {
 public:
  ComplexRenderer(Size2 frame, const SIZE& request) : grey_(frame, request) {}

  const Reduction& reduction() const override { return grey_.reduction(); }

  void Add(const FramePiece& piece) override { Add(As<ComplexPixel<T>>(piece.pixels), piece.x, piece.y); }

  void Add(const ImageView<const ComplexPixel<T>>& pixels, std::int32_t x, std::int32_t y) {
    const bool dense = pixels.pixelStride == static_cast<std::int64_t>(sizeof(ComplexPixel<T>));
    for (std::int32_t row = 0; row < pixels.height; ++row) {
      for (std::int32_t column = 0; column < pixels.width; column += kMostColumns) {
        const std::int32_t count = std::min(pixels.width - column, kMostColumns);
        const std::byte* const part = pixels.At(column, row);
        // With the stride known to the compiler, the common case is done with vectors.
        dense ? SquareMagnitudes(part, sizeof(ComplexPixel<T>), count)
              : SquareMagnitudes(part, pixels.pixelStride, count);
        LogarithmsToFloat(squares_.data(), static_cast<std::size_t>(count), logarithms_.data());
        grey_.Add(PackedView<const float>(logarithms_.data(), count, 1), x + column, y + row);
      }
    }
  }

  HBITMAP Finish() override { return grey_.Finish(); }

 private:
  static constexpr std::int32_t kMostColumns = 2048;

  void SquareMagnitudes(const std::byte* pixels, std::int64_t pixelStride, std::int32_t count) {
    for (std::int32_t i = 0; i < count; ++i) {
      T parts[2];
      std::memcpy(&parts[0], pixels + i * pixelStride, sizeof(T));
      std::memcpy(&parts[1], pixels + i * pixelStride + sizeof(T), sizeof(T));
      const double re = parts[0];
      const double im = parts[1];
      squares_[static_cast<std::size_t>(i)] = re * re + im * im;
    }
  }

  GreyRenderer<float> grey_;
  std::array<double, kMostColumns> squares_;
  std::array<float, kMostColumns> logarithms_;
};

/// Averages straight into the bitmap.
template <ColourOrder kOrder>
class ColourRenderer final : public FrameRenderer {
 public:
  ColourRenderer(Size2 frame, const SIZE& request) : reduction_(ColourReduction(frame, request)) {
    bitmap_.CreateColour(reduction_.size.width, reduction_.size.height);
    if (bitmap_.Bits().data != nullptr) reducer_.emplace(reduction_.factor, AsBgrPixels(bitmap_.Bits()));
  }

  const Reduction& reduction() const override { return reduction_; }

  void Add(const FramePiece& piece) override {
    if (reducer_) reducer_->Add(As<ColourPixel<kOrder>>(piece.pixels), piece.x, piece.y);
  }

  HBITMAP Finish() override { return bitmap_.Release(); }

 private:
  Reduction reduction_;
  DibSection bitmap_;
  std::optional<BoxReducer<ColourPixel<kOrder>>> reducer_;
};

template <class T>
std::unique_ptr<FrameRenderer> Make(std::type_identity<T>, Size2 frame, const SIZE& request) {
  return std::make_unique<GreyRenderer<T>>(frame, request);
}

template <class T>
std::unique_ptr<FrameRenderer> Make(std::type_identity<ComplexPixel<T>>, Size2 frame, const SIZE& request) {
  return std::make_unique<ComplexRenderer<T>>(frame, request);
}

template <ColourOrder kOrder>
std::unique_ptr<FrameRenderer> Make(std::type_identity<ColourPixel<kOrder>>, Size2 frame,
                                    const SIZE& request) {
  return std::make_unique<ColourRenderer<kOrder>>(frame, request);
}

std::unique_ptr<FrameRenderer> Make(std::monostate, Size2, const SIZE&) {
  return nullptr;
}

}  // namespace

std::unique_ptr<FrameRenderer> MakeFrameRenderer(PixelTag pixel, Size2 frame, const SIZE& request) {
  return std::visit([&](auto tag) { return Make(tag, frame, request); }, pixel);
}

template <class T>
HBITMAP RenderGreyThumbnail(const ImageView<const T>& frame, const SIZE& request) {
  const Reduction reduction = GreyReduction({frame.width, frame.height}, request);
  GreyImage<T> image(reduction.size);
  if (!image.empty()) DownsampleBox(frame, reduction.factor, image.view());
  return image.ToBitmap();
}

template <class T>
HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<T>>& frame, const SIZE& request) {
  ComplexRenderer<T> renderer({frame.width, frame.height}, request);
  const Reduction& reduction = renderer.reduction();
  if (!IsEmpty(reduction)) {
    renderer.Add(
        frame.Part(0, 0, reduction.size.width * reduction.factor, reduction.size.height * reduction.factor),
        0, 0);
  }
  return renderer.Finish();
}

template <ColourOrder kOrder>
HBITMAP RenderColourThumbnail(const ImageView<const ColourPixel<kOrder>>& frame, const SIZE& request) {
  const Reduction reduction = ColourReduction({frame.width, frame.height}, request);
  DibSection bitmap;
  bitmap.CreateColour(reduction.size.width, reduction.size.height);
  if (bitmap.Bits().data != nullptr) DownsampleBoxRgb(frame, reduction.factor, bitmap.Bits());
  return bitmap.Release();
}

template HBITMAP RenderGreyThumbnail(const ImageView<const std::uint8_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const std::uint16_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const std::uint32_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const std::int8_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const std::int16_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const std::int32_t>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const float>&, const SIZE&);
template HBITMAP RenderGreyThumbnail(const ImageView<const double>&, const SIZE&);
template HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<std::int16_t>>&, const SIZE&);
template HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<float>>&, const SIZE&);
template HBITMAP RenderComplexThumbnail(const ImageView<const ComplexPixel<double>>&, const SIZE&);
template HBITMAP RenderColourThumbnail(const ImageView<const ColourPixel<ColourOrder::kRedFirst>>&,
                                       const SIZE&);
template HBITMAP RenderColourThumbnail(const ImageView<const ColourPixel<ColourOrder::kBlueFirst>>&,
                                       const SIZE&);

}  // namespace Qel::Lumetra::ShellExt
