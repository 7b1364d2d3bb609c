// The numbering of pixel types that .ser and .ebn files share.
#pragma once

#include <cstdint>
#include <optional>

#include "data_type.h"

namespace Qel::Lumetra::ShellExt {

/// Returns the type with the number `code`, counted from 1; none for an unused number.
std::optional<DataType> DataTypeOfCode(std::int32_t code);

}  // namespace Qel::Lumetra::ShellExt
