#include "divide.h"

#include <csignal>
#include <limits>

namespace Qel::Lumetra::ShellExt {
namespace {

/// Ends the process as a division by zero does. On x86-64 it executes a faulting instruction, because the
/// compiler may assume that C++ code never divides by zero.
[[noreturn]] void RaiseDivideFault() {
#ifdef __x86_64__
  asm volatile("xorl %%ecx, %%ecx\n\tmovl $1, %%eax\n\tcltd\n\tidivl %%ecx" : : : "eax", "ecx", "edx", "cc");
#else
  std::raise(SIGFPE);
#endif
  __builtin_trap();
}

}  // namespace

std::int32_t DivideOrFault(std::int32_t dividend, std::int32_t divisor) {
  const bool overflows = dividend == std::numeric_limits<std::int32_t>::min() && divisor == -1;
  if (divisor == 0 || overflows) RaiseDivideFault();
  return dividend / divisor;
}

}  // namespace Qel::Lumetra::ShellExt
