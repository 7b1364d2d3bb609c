#include "data_type.h"

namespace Qel::Lumetra::ShellExt {
namespace {

struct Description {
  const wchar_t* name;
  std::int32_t bits;
};

Description Describe(DataType type) {
  switch (type) {
    case DataType::kUInt8: return {L"8 bit unsigned", 8};
    case DataType::kUInt16: return {L"16 bit unsigned", 16};
    case DataType::kUInt32: return {L"32 bit unsigned", 32};
    case DataType::kInt8: return {L"8 bit signed", 8};
    case DataType::kInt16: return {L"16 bit signed", 16};
    case DataType::kInt32: return {L"32 bit signed", 32};
    case DataType::kFloat32: return {L"32 bit float", 32};
    case DataType::kFloat64: return {L"64 bit float", 64};
    case DataType::kComplexFloat32: return {L"64 bit complex float", 64};
    case DataType::kComplexFloat64: return {L"128 bit complex float", 128};
    case DataType::kRgb24: return {L"24 bit RGB", 24};
    case DataType::kBgr24: return {L"24 bit BGR", 24};
  }
  return {L"Unknown", 0};
}

}  // namespace

std::wstring DataTypeName(DataType type) {
  return Describe(type).name;
}

std::int32_t BitsPerPixel(DataType type) {
  return Describe(type).bits;
}

}  // namespace Qel::Lumetra::ShellExt
