// The stack guard, with which functions detect that their stack was overrun, and the reaction to an overrun.
// They replace the compiler's stack protector library.
//
// That library gets its random number from the system's cryptography functions, which load more modules while
// the DLL itself is being loaded. The loader lock is held then, so this could deadlock the host process.
// Instead, the number is mixed from values that differ from load to load, as in the system's own modules.
#include <windows.h>

#include <cstdint>

extern "C" {

/// The number between a function's buffers and its return address. It is random once the DLL has started.
std::uintptr_t __stack_chk_guard = 0xBB40E64EDA205900;

/// Ends the process at once with the system's fast-fail interrupt, because nothing on the stack can be
/// trusted.
[[noreturn]] void __stack_chk_fail() {
  constexpr int kStackWasOverrun = 2;
  asm volatile("int $0x29" : : "c"(kStackWasOverrun));
  __builtin_unreachable();
}

}  // extern "C"

namespace {

/// Returns a number in which every bit depends on all bits of both arguments.
std::uint64_t Mix(std::uint64_t a, std::uint64_t b) {
  std::uint64_t mixed = a * 0x9E3779B97F4A7C15 + b;
  mixed = (mixed ^ (mixed >> 30)) * 0xBF58476D1CE4E5B9;
  mixed = (mixed ^ (mixed >> 27)) * 0x94D049BB133111EB;
  return mixed ^ (mixed >> 31);
}

/// Sets the guard before other static objects are constructed. This function must not be guarded itself,
/// because it changes the number.
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
  // The zero byte stops an overrunning string function.
  __stack_chk_guard = number & ~std::uint64_t{0xFF};
}

}  // namespace
