// A grey picture on its way from averages to grey levels, mostly in the memory of its bitmap.
#pragma once

#include <windows.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <memory>
#include <new>

#include "dib_section.h"
#include "grey_levels.h"
#include "image_view.h"
#include "size2.h"

namespace Qel::Lumetra::ShellExt {

/// An image whose rows lie in two pieces of memory: the upper ones in one, the lower ones in the other.
template <class T>
struct SplitView {
  std::int32_t width = 0;
  std::int32_t height = 0;
  ImageView<T> upper;
  ImageView<T> lower;

  std::byte* At(std::int32_t x, std::int32_t y) const {
    return y < upper.height ? upper.At(x, y) : lower.At(x, y - upper.height);
  }
};

/// The reduced image of a grey frame, and the bitmap that becomes of it. Grey levels can only be told when
/// the last value is known, so all values are kept until then: as many rows as fit in the bitmap itself,
/// from its beginning, and memory beside it is taken only for the others.
template <class T>
class GreyImage {
 public:
  /// Throws std::bad_alloc when there is no memory for the values.
  explicit GreyImage(Size2 size) : size_(size) {
    if (size.width > 0 && size.height > 0) {
      if (std::int64_t{size.width} * size.height > std::numeric_limits<std::int32_t>::max()) {
        throw std::bad_alloc();
      }
      beside_ = std::make_unique_for_overwrite<std::byte[]>(
          static_cast<std::size_t>((size.height - RowsInBitmap()) * RowBytes()));
    }
    bitmap_.CreateGrey(size.width, size.height);
  }

  /// Whether there are no values, because there is no bitmap.
  bool empty() const { return bitmap_.Bits().data == nullptr; }

  /// The values, which may be written in any order.
  SplitView<T> view() const {
    const auto part = [this](void* memory, std::int32_t rows) {
      return ImageView<T>{size_.width, rows, static_cast<T*>(memory), sizeof(T), RowBytes()};
    };
    const std::int32_t rows = RowsInBitmap();
    return {size_.width, size_.height, part(bitmap_.Bits().data, rows),
            part(beside_.get(), size_.height - rows)};
  }

  /// Turns the values into grey levels. The bitmap is the caller's; null when the system did not make one.
  HBITMAP ToBitmap() {
    // A row's grey levels begin no later than its values, so rows from the top never lose values to levels.
    if (!empty()) MapToGreyLevels<T>(view(), bitmap_.Bits());
    return bitmap_.Release();
  }

 private:
  std::int64_t LevelRowBytes() const { return BitmapRowStride(size_.width, 1); }

  /// Bytes from a row of values to the next: not less than from a row of grey levels to the next.
  std::int64_t RowBytes() const {
    return std::max<std::int64_t>(std::int64_t{size_.width} * std::int64_t{sizeof(T)}, LevelRowBytes());
  }

  std::int32_t RowsInBitmap() const {
    return static_cast<std::int32_t>(LevelRowBytes() * size_.height / RowBytes());
  }

  Size2 size_;
  DibSection bitmap_;
  std::unique_ptr<std::byte[]> beside_;
};

}  // namespace Qel::Lumetra::ShellExt
