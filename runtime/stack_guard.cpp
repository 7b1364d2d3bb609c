// The number by which functions see that their stack was overrun, and what happens then, in place of the
// compiler's library of that.
//
// The library asks the system's cryptography for the number, which loads further modules while the DLL itself
// is being loaded. The loader's lock is held then, and a guest that does so can block the process. As in the
// system's own modules, the number is mixed of what is different from load to load.
#include <windows.h>

#include <cstdint>

extern "C" {

/// Lies between a function's buffers and its return address. Random once the DLL has started.
std::uintptr_t __stack_chk_guard = 0xBB40E64EDA205900;

/// Ends the process at once, by the system's own way for that, as nothing that the stack says can be trusted.
[[noreturn]] void __stack_chk_fail() {
  constexpr int kStackWasOverrun = 2;
  asm volatile("int $0x29" : : "c"(kStackWasOverrun));
  __builtin_unreachable();
}

}  // extern "C"

namespace {

/// Every bit of the answer depends on all bits of both numbers.
std::uint64_t Mix(std::uint64_t a, std::uint64_t b) {
  std::uint64_t mixed = a * 0x9E3779B97F4A7C15 + b;
  mixed = (mixed ^ (mixed >> 30)) * 0xBF58476D1CE4E5B9;
  mixed = (mixed ^ (mixed >> 27)) * 0x94D049BB133111EB;
  return mixed ^ (mixed >> 31);
}

/// Runs before the other static objects are made. It must not be guarded itself, as it changes the number.
[[gnu::constructor(101), gnu::no_stack_protector]] void MakeGuard() {
  FILETIME time{};
  GetSystemTimeAsFileTime(&time);
  LARGE_INTEGER ticks{};
  QueryPerformanceCounter(&ticks);
  std::uint64_t number = Mix((std::uint64_t{time.dwHighDateTime} << 32) | time.dwLowDateTime,
                             static_cast<std::uint64_t>(ticks.QuadPart));
  number = Mix(number, (std::uint64_t{GetCurrentProcessId()} << 32) | GetCurrentThreadId());
  number = Mix(number, reinterpret_cast<std::uintptr_t>(&__stack_chk_guard));
  number = Mix(number, reinterpret_cast<std::uintptr_t>(&ticks));
  // A text that overruns ends at the zero.
  __stack_chk_guard = number & ~std::uint64_t{0xFF};
}

}  // namespace
