// This program's stack is guarded in the same way as the DLL's.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstddef>
#include <cstdint>

extern "C" std::uintptr_t __stack_chk_guard;

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

TEST(StackGuard, BeginsWithAByteThatEndsStrings) {
  EXPECT_NE(__stack_chk_guard >> 8, 0u);
  EXPECT_EQ(__stack_chk_guard & 0xFF, 0u);
  EXPECT_NE(__stack_chk_guard, 0xBB40E64EDA205900);  // its value before it is initialized
}

/// Writes `count` bytes into an array of eight.
[[gnu::noinline]] void Overrun(std::size_t count) {
  volatile char bytes[8] = {};
  volatile char* const begin = bytes;
  for (std::size_t i = 0; i < count; ++i) begin[i] = 'x';
}

TEST(StackGuardDeathTest, EndsAProcessWhoseStackIsOverrun) {
  constexpr int kStackBufferOverrun = static_cast<int>(0xC0000409);
  volatile std::size_t count = 24;
  EXPECT_EXIT(Overrun(count), testing::ExitedWithCode(kStackBufferOverrun), "");
  count = 8;
  Overrun(count);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
