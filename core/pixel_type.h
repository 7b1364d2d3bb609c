// Everything that the layers know about a pixel type. The two enumerations of pixel types, DataType
// (data_type.h) and MrcPixelType (mrc_parser.h), map their values to it.
#pragma once

#include <cstdint>
#include <type_traits>
#include <variant>

#include "pixel.h"

namespace Qel::Lumetra::ShellExt {

/// The C++ type of a pixel as a value, which decides how a frame is rendered. Frames with std::monostate
/// cannot be rendered.
using PixelTag = std::variant<
    std::monostate, std::type_identity<std::uint8_t>, std::type_identity<std::uint16_t>,
    std::type_identity<std::uint32_t>, std::type_identity<std::int8_t>, std::type_identity<std::int16_t>,
    std::type_identity<std::int32_t>, std::type_identity<float>, std::type_identity<double>,
    std::type_identity<ComplexPixel<std::int16_t>>, std::type_identity<ComplexPixel<float>>,
    std::type_identity<ComplexPixel<double>>, std::type_identity<RgbPixel>, std::type_identity<BgrPixel>>;

/// The default is the unknown type.
struct PixelType {
  const wchar_t* name = L"Unknown";
  std::int32_t bits = 0;  // of one pixel
  PixelTag tag;

  /// Returns the type of frames whose pixels are stored as `Pixel`.
  template <class Pixel>
  static constexpr PixelType Of(const wchar_t* name) {
    return {name, 8 * static_cast<std::int32_t>(sizeof(Pixel)), std::type_identity<Pixel>()};
  }

  constexpr std::int32_t bytes() const { return bits / 8; }
};

}  // namespace Qel::Lumetra::ShellExt
