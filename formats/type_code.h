// The numbers of pixel types that .ser and .ebn files share.
#pragma once

#include <cstdint>
#include <optional>

#include "data_type.h"

namespace Qel::Lumetra::ShellExt {

/// Returns the pixel type with the number `code`, from 1 to 10; nothing for any other number.
std::optional<DataType> DataTypeOfCode(std::int32_t code);

}  // namespace Qel::Lumetra::ShellExt
