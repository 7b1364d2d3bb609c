#include "frame_renderer.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <new>
#include <optional>

#include "box_reducer.h"
#include "dib_section.h"
#include "grey_levels.h"
#include "logarithm.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Allocates the values of a reduced image. Throws std::bad_alloc if there are more values than a signed
/// 32-bit integer can count; no bitmap is that large.
template <class T>
std::unique_ptr<T[]> AllocateImage(Size2 size) {
  const std::int64_t count = std::int64_t{size.width} * size.height;
  if (count > std::numeric_limits<std::int32_t>::max()) throw std::bad_alloc();
  return std::make_unique_for_overwrite<T[]>(static_cast<std::size_t>(count));
}

/// Keeps the whole reduced image, because the grey levels depend on the range of all its values.
template <class T>
class GreyRenderer final : public FrameRenderer {
 public:
  GreyRenderer(Size2 frame, const SIZE& request)
      : reduction_(GreyReduction(frame, request)),
        size_(reduction_.HasBlocks() ? reduction_.size : Size2{}),
        values_(AllocateImage<T>(size_)),
        reducer_(reduction_.factor, PackedView(values_.get(), size_.width, size_.height)) {}

  const Reduction& reduction() const override { return reduction_; }

  void Add(const FramePiece& piece) override { Add(ViewAs<const T>(piece.pixels), piece.x, piece.y); }

  void Add(const ImageView<const T>& pixels, std::int32_t x, std::int32_t y) { reducer_.Add(pixels, x, y); }

  HBITMAP Finish() override {
    DibSection bitmap;
    bitmap.CreateGrey(size_.width, size_.height);
    if (bitmap.Bits().data != nullptr) MapToGreyLevels(values_.get(), bitmap.Bits());
    return bitmap.Release();
  }

 private:
  Reduction reduction_;
  Size2 size_;  // of the reduced image; 0 by 0 if it has no whole block
  std::unique_ptr<T[]> values_;
  BoxReducer<T> reducer_;
};

/// Renders the logarithm of every pixel's squared magnitude as a frame of floats.
template <class T>
class ComplexRenderer final : public FrameRenderer {
 public:
  ComplexRenderer(Size2 frame, const SIZE& request) : grey_(frame, request) {}

  const Reduction& reduction() const override { return grey_.reduction(); }

  void Add(const FramePiece& piece) override {
    Add(ViewAs<const ComplexPixel<T>>(piece.pixels), piece.x, piece.y);
  }

  void Add(const ImageView<const ComplexPixel<T>>& pixels, std::int32_t x, std::int32_t y) {
    const bool dense = pixels.pixelStride == static_cast<std::int64_t>(sizeof(ComplexPixel<T>));
    for (std::int32_t row = 0; row < pixels.height; ++row) {
      for (std::int32_t column = 0; column < pixels.width; column += kMaxColumns) {
        const std::int32_t count = std::min(pixels.width - column, kMaxColumns);
        const std::byte* const part = pixels.At(column, row);
        // A stride known at compile time lets the compiler use vectors for the common case.
        dense ? SquareMagnitudes(part, sizeof(ComplexPixel<T>), count)
              : SquareMagnitudes(part, pixels.pixelStride, count);
        LogarithmsToFloat(squares_.data(), static_cast<std::size_t>(count), logarithms_.data());
        grey_.Add(PackedView<const float>(logarithms_.data(), count, 1), x + column, y + row);
      }
    }
  }

  HBITMAP Finish() override { return grey_.Finish(); }

 private:
  static constexpr std::int32_t kMaxColumns = 2048;

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
  std::array<double, kMaxColumns> squares_;
  std::array<float, kMaxColumns> logarithms_;
};

/// Writes the averages straight into the bitmap, if the system creates one.
template <ColourOrder kOrder>
class ColourRenderer final : public FrameRenderer {
 public:
  ColourRenderer(Size2 frame, const SIZE& request) : reduction_(ColourReduction(frame, request)) {
    bitmap_.CreateColour(reduction_.size.width, reduction_.size.height);
    if (bitmap_.Bits().data != nullptr) {
      reducer_.emplace(reduction_.factor, ViewAs<BgrPixel>(bitmap_.Bits()));
    }
  }

  const Reduction& reduction() const override { return reduction_; }

  void Add(const FramePiece& piece) override {
    if (reducer_) reducer_->Add(ViewAs<const ColourPixel<kOrder>>(piece.pixels), piece.x, piece.y);
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

}  // namespace Qel::Lumetra::ShellExt
