// Tests the conversion of strings that files contain.
#include "text_tools.h"

#include <gtest/gtest.h>

namespace Qel::Lumetra::ShellExt::Show {
namespace {

TEST(TextOfFile, IsUtf8OrElseOfTheWesternCodePage) {
  EXPECT_EQ(TextOfFile(""), L"");
  EXPECT_EQ(TextOfFile("Position"), L"Position");
  EXPECT_EQ(TextOfFile("\xC2\xB5m"), L"\u00B5m");
  EXPECT_EQ(TextOfFile("\xB5m"), L"\u00B5m");
  EXPECT_EQ(TextOfFile("\x80"), L"\u20AC");
}

TEST(TextOfFile, EndsAtItsFirstZeroByte) {
  EXPECT_EQ(TextOfFile({"nm\0x", 4}), L"nm");
  EXPECT_EQ(TextOfFile({"\0", 1}), L"");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show
