// Tests the divisions by zero that end the process by design, each in a child process.
#include <gtest/gtest.h>
#include <windows.h>

#include <csignal>

#include "divide.h"
#include "whole_frame.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Restores the default action. A sanitizer would handle the signal, but the child process must end by it.
void LeaveFaultsToTheSystem() {
  std::signal(SIGFPE, SIG_DFL);
}

/// Returns whether a process was ended by an integer division by zero.
bool EndedByDivideFault(int status) {
#ifdef _WIN32
  return static_cast<DWORD>(status) == EXCEPTION_INT_DIVIDE_BY_ZERO;
#else
  return testing::KilledBySignal(SIGFPE)(status);
#endif
}

TEST(RequiredFaultDeathTest, ColourFrameSmallerThanTheRequest) {
  const std::byte bytes[12] = {};
  const ImageView<const ColourPixel<ColourOrder::kRedFirst>> frame{
      2, 2, reinterpret_cast<const ColourPixel<ColourOrder::kRedFirst>*>(bytes), 3, 6};
  EXPECT_EXIT(
      {
        LeaveFaultsToTheSystem();
        RenderColourThumbnail<ColourOrder::kRedFirst>(frame, {3, 3});
      },
      EndedByDivideFault, "");
}

TEST(RequiredFaultDeathTest, RequestOfZero) {
  const std::uint8_t value = 0;
  const auto frame = PackedView(&value, 1, 1);
  for (const SIZE& request : {SIZE{0, 96}, SIZE{96, 0}}) {
    EXPECT_EXIT(
        {
          LeaveFaultsToTheSystem();
          RenderGreyThumbnail<std::uint8_t>(frame, request);
        },
        EndedByDivideFault, "");
  }
}

TEST(Divide, TruncatesTowardZero) {
  EXPECT_EQ(DivideOrFault(7, 2), 3);
  EXPECT_EQ(DivideOrFault(-7, 2), -3);
  EXPECT_EQ(DivideOrFault(7, -2), -3);
  EXPECT_EQ(DivideOrFault(0, 5), 0);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
