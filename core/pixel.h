// C++ types of pixels that are more than one number, laid out as a file stores them.
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

using RgbPixel = ColourPixel<ColourOrder::kRedFirst>;
using BgrPixel = ColourPixel<ColourOrder::kBlueFirst>;

}  // namespace Qel::Lumetra::ShellExt
