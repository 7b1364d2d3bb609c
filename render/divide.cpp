#include "divide.h"

#include <limits>

namespace Qel::Lumetra::ShellExt {
namespace {

/// Executes a division by zero, as an instruction because the compiler may assume that C++ code does not.
[[noreturn]] void RaiseDivideFault() {
#if !defined(__x86_64__)
#error "The required divide fault is written for x86-64."
#endif
  asm volatile("xorl %%ecx, %%ecx\n\tmovl $1, %%eax\n\tcltd\n\tidivl %%ecx" : : : "eax", "ecx", "edx", "cc");
  __builtin_trap();
}

}  // namespace

std::int32_t DivideOrFault(std::int32_t dividend, std::int32_t divisor) {
  const bool overflows = dividend == std::numeric_limits<std::int32_t>::min() && divisor == -1;
  if (divisor == 0 || overflows) RaiseDivideFault();
  return dividend / divisor;
}

}  // namespace Qel::Lumetra::ShellExt
