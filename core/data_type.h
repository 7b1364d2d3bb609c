// The pixel types that the RAW, EBN, SER and EMI readers share. The MRC family has an enumeration of its own
// (mrc_parser.h).
#pragma once

#include <cstdint>
#include <string>

#include "pixel_type.h"

namespace Qel::Lumetra::ShellExt {

/// The values are fixed, gaps included. A value that is not listed is an unknown type.
enum class DataType : std::uint32_t {
  kUInt8 = 0,
  kUInt16 = 1,
  kUInt32 = 2,
  kInt8 = 4,
  kInt16 = 5,
  kInt32 = 6,
  kFloat32 = 8,
  kFloat64 = 9,
  kComplexFloat32 = 10,  // a pair of 32-bit floats, 64 bits in all
  kComplexFloat64 = 13,  // a pair of 64-bit floats, 128 bits in all
  kRgb24 = 16,
  kBgr24 = 18,
};

/// Returns the default PixelType, "Unknown" with 0 bits, for a value that is not listed.
PixelType PixelTypeOf(DataType type);

/// Returns the display name, for instance "16 bit signed"; "Unknown" for a value that is not listed.
std::wstring DataTypeName(DataType type);

/// Returns the bits per pixel; 0 for a value that is not listed.
std::int32_t BitsPerPixel(DataType type);

}  // namespace Qel::Lumetra::ShellExt
