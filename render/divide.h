// Integer division as the processor does it.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt {

/// `dividend` / `divisor`, truncated toward zero. A divisor of 0 is a fault of the process (an integer
/// division by zero), by construction and not by undefined behaviour: a request of 0 pixels, and a colour
/// frame that is smaller than the request in both dimensions, are meant to end that way.
std::int32_t DivideOrFault(std::int32_t dividend, std::int32_t divisor);

}  // namespace Qel::Lumetra::ShellExt
