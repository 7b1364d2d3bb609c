// The ways in which a pixel can be stored in a frame, and their C++ types.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

/// Real part first, then the imaginary part.
template <class T>
struct ComplexPixel {
  T re;
  T im;
};

/// Byte order of a colour pixel: red, green, blue or blue, green, red. Bitmaps hold blue first.
enum class ColourOrder { kRedFirst, kBlueFirst };

template <ColourOrder kOrder>
struct ColourPixel {
  std::uint8_t channel[3];
};

using BitmapPixel = ColourPixel<ColourOrder::kBlueFirst>;

enum class PixelFormat {
  kUInt8,
  kUInt16,
  kUInt32,
  kInt8,
  kInt16,
  kInt32,
  kFloat32,
  kFloat64,
  kComplexInt16,
  kComplexFloat32,
  kComplexFloat64,
  kRgb24,
  kBgr24,
};

/// Bytes of one pixel in the file.
std::int32_t BytesPerPixel(PixelFormat format);

}  // namespace Qel::Lumetra::ShellExt
