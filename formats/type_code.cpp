#include "type_code.h"

namespace Qel::Lumetra::ShellExt {

std::optional<DataType> DataTypeOfCode(std::int32_t code) {
  switch (code) {
    case 1: return DataType::kUInt8;
    case 2: return DataType::kUInt16;
    case 3: return DataType::kUInt32;
    case 4: return DataType::kInt8;
    case 5: return DataType::kInt16;
    case 6: return DataType::kInt32;
    case 7: return DataType::kFloat32;
    case 8: return DataType::kFloat64;
    case 9: return DataType::kComplexFloat32;
    case 10: return DataType::kComplexFloat64;
    default: return std::nullopt;
  }
}

}  // namespace Qel::Lumetra::ShellExt
