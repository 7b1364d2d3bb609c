// Loads strings of this program's own string table, strings.rc. string_table_test tests the DLL's table.
#include <gtest/gtest.h>

#include <string>

#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Returns the first `length` letters of the alphabet, repeated without end.
std::wstring Letters(std::size_t length) {
  std::wstring letters;
  for (std::size_t i = 0; i < length; ++i) letters += static_cast<wchar_t>(L'a' + i % 26);
  return letters;
}

TEST(LoadResourceString, ReturnsTheStringOfTheTable) {
  EXPECT_EQ(LoadResourceString(1), L"first");
  EXPECT_EQ(LoadResourceString(2), L"second");
}

TEST(LoadResourceString, TruncatesTo255Characters) {
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
