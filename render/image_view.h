// A non-owning description of a rectangle of pixels in memory. Every loop over pixels goes through one, so
// packed, bottom-up and interleaved buffers and the bits of a bitmap need no code of their own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace Qel::Lumetra::ShellExt {

template <class T>
struct ImageView {
  using Pixel = std::remove_const_t<T>;
  using Byte = std::conditional_t<std::is_const_v<T>, const std::byte, std::byte>;

  std::int32_t width = 0;
  std::int32_t height = 0;
  T* data = nullptr;             // the pixel at column 0 of the top row
  std::int64_t pixelStride = 0;  // bytes from a pixel to its right neighbour
  std::int64_t rowStride = 0;    // bytes from a row to the one below it; negative for bottom-up rows

  /// Returns the address of the pixel at column `x` of row `y`. It need not be aligned for T.
  Byte* At(std::int32_t x, std::int32_t y) const {
    return reinterpret_cast<Byte*>(data) + y * rowStride + x * pixelStride;
  }

  Pixel Load(std::int32_t x, std::int32_t y) const {
    Pixel pixel;
    std::memcpy(&pixel, At(x, y), sizeof(Pixel));
    return pixel;
  }

  void Store(std::int32_t x, std::int32_t y, const Pixel& pixel) const {
    std::memcpy(At(x, y), &pixel, sizeof(Pixel));
  }

  /// Returns the part of `columns` by `rows` pixels whose first pixel is at column `x` of row `y`.
  ImageView Part(std::int32_t x, std::int32_t y, std::int32_t columns, std::int32_t rows) const {
    return {columns, rows, reinterpret_cast<T*>(At(x, y)), pixelStride, rowStride};
  }
};

/// Returns a view of `width` by `height` contiguous pixels, top row first.
template <class T>
ImageView<T> PackedView(T* data, std::int32_t width, std::int32_t height) {
  return {width, height, data, sizeof(T), std::int64_t{width} * std::int64_t{sizeof(T)}};
}

/// Returns a view of the same pixels as another type.
template <class To, class From>
ImageView<To> ViewAs(const ImageView<From>& view) {
  return {view.width, view.height, reinterpret_cast<To*>(view.data), view.pixelStride, view.rowStride};
}

}  // namespace Qel::Lumetra::ShellExt
