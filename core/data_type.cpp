#include "data_type.h"

namespace Qel::Lumetra::ShellExt {

PixelType PixelTypeOf(DataType type) {
  switch (type) {
    case DataType::kUInt8: return PixelType::Of<std::uint8_t>(L"8 bit unsigned");
    case DataType::kUInt16: return PixelType::Of<std::uint16_t>(L"16 bit unsigned");
    case DataType::kUInt32: return PixelType::Of<std::uint32_t>(L"32 bit unsigned");
    case DataType::kInt8: return PixelType::Of<std::int8_t>(L"8 bit signed");
    case DataType::kInt16: return PixelType::Of<std::int16_t>(L"16 bit signed");
    case DataType::kInt32: return PixelType::Of<std::int32_t>(L"32 bit signed");
    case DataType::kFloat32: return PixelType::Of<float>(L"32 bit float");
    case DataType::kFloat64: return PixelType::Of<double>(L"64 bit float");
    case DataType::kComplexFloat32: return PixelType::Of<ComplexPixel<float>>(L"64 bit complex float");
    case DataType::kComplexFloat64: return PixelType::Of<ComplexPixel<double>>(L"128 bit complex float");
    case DataType::kRgb24: return PixelType::Of<RgbPixel>(L"24 bit RGB");
    case DataType::kBgr24: return PixelType::Of<BgrPixel>(L"24 bit BGR");
  }
  return {};
}

std::wstring DataTypeName(DataType type) {
  return PixelTypeOf(type).name;
}

std::int32_t BitsPerPixel(DataType type) {
  return PixelTypeOf(type).bits;
}

}  // namespace Qel::Lumetra::ShellExt
