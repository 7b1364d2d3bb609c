// Integer division that keeps the processor's division fault.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

/// Returns `dividend` / `divisor`, truncated toward zero. A divisor of 0, or a quotient that 32 bits cannot
/// hold, ends the process with an integer division fault, raised explicitly rather than left to undefined
/// behaviour. The fault is the intended result of a request of 0 pixels and of a colour frame smaller than
/// the request in both dimensions.
std::int32_t DivideOrFault(std::int32_t dividend, std::int32_t divisor);

}  // namespace Qel::Lumetra::ShellExt
