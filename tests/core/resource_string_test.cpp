// Strings of the test program's own table, strings.rc. What is in the DLL's is in string_table_test.
#include <gtest/gtest.h>

#include <string>

#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// The first `length` letters of the endless alphabet.
std::wstring Letters(std::size_t length) {
  std::wstring letters;
  for (std::size_t i = 0; i < length; ++i) letters += static_cast<wchar_t>(L'a' + i % 26);
  return letters;
}

TEST(LoadResourceString, ReturnsWhatTheTableHolds) {
  EXPECT_EQ(LoadResourceString(1), L"first");
  EXPECT_EQ(LoadResourceString(2), L"second");
}

TEST(LoadResourceString, CutsAfter255Characters) {
  EXPECT_EQ(LoadResourceString(255), Letters(255));
  EXPECT_EQ(LoadResourceString(256), Letters(255));
  EXPECT_EQ(LoadResourceString(257), Letters(255));
}

TEST(LoadResourceString, IsEmptyForAnIdThatIsNotInTheTable) {
  for (const std::uint32_t id : {0u, 3u, 254u, 258u, 1000u, 0xFFFFu, 0xFFFFFFFFu}) {
    EXPECT_EQ(LoadResourceString(id), L"") << id;
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
