// C++ types of the pixels that consist of more than one number, with the memory layout that files use.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

/// The real part is stored first.
template <class T>
struct ComplexPixel {
  T re;
  T im;
};

/// The byte order of a colour pixel: red, green, blue or blue, green, red. Bitmaps store blue first.
enum class ColourOrder { kRedFirst, kBlueFirst };

template <ColourOrder kOrder>
struct ColourPixel {
  std::uint8_t channel[3];
};

using RgbPixel = ColourPixel<ColourOrder::kRedFirst>;
using BgrPixel = ColourPixel<ColourOrder::kBlueFirst>;

}  // namespace Qel::Lumetra::ShellExt
