// The numbering of pixel types that .ser and .ebn files have in common.
#pragma once

#include <cstdint>
#include <optional>

#include "data_type.h"

namespace Qel::Lumetra::ShellExt {

/// The type with the number `code`, from 1; none for a number that is not given to any.
std::optional<DataType> DataTypeOfCode(std::int32_t code);

}  // namespace Qel::Lumetra::ShellExt
