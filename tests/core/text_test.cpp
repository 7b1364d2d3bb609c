#include "text.h"

#include <gtest/gtest.h>

#include <string_view>

#include "same_text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

std::wstring Widen(std::string_view bytes) {
  return WidenComment(bytes.data(), bytes.data() + bytes.size());
}

TEST(WidenComment, KeepsTheLowerHalfOfTheBytes) {
  for (int byte = 0; byte < 0x80; ++byte) {
    EXPECT_EQ(Widen(std::string(1, static_cast<char>(byte))), std::wstring(1, static_cast<wchar_t>(byte)));
  }
}

TEST(WidenComment, ExtendsTheSignOfTheUpperHalf) {
  for (int byte = 0x80; byte < 0x100; ++byte) {
    EXPECT_EQ(Widen(std::string(1, static_cast<char>(byte))),
              std::wstring(1, static_cast<wchar_t>(0xFF00 + byte)));
  }
  EXPECT_EQ(Widen("\xB5"), std::wstring(1, wchar_t{0xFFB5}));
  EXPECT_EQ(Widen("\xE9"), std::wstring(1, wchar_t{0xFFE9}));
}

TEST(WidenComment, KeepsTheLength) {
  EXPECT_EQ(WidenComment(nullptr, nullptr), L"");
  EXPECT_EQ(Widen(""), L"");
  EXPECT_EQ(Widen("a text"), L"a text");
  EXPECT_EQ(Widen(std::string_view("a\0b", 3)), std::wstring(L"a\0b", 3));
}

TEST(SameIgnoringCase, IgnoresTheCaseOfAToZOnly) {
  EXPECT_TRUE(SameIgnoringCase(L"", L""));
  EXPECT_TRUE(SameIgnoringCase(L"AbyZ@[`{", L"aBYz@[`{"));
  EXPECT_FALSE(SameIgnoringCase(L"ab", L"abc"));
  EXPECT_FALSE(SameIgnoringCase(L"abc", L"ab"));
  EXPECT_FALSE(SameIgnoringCase(L"@", L"`"));
  EXPECT_FALSE(SameIgnoringCase(L"[", L"{"));
  EXPECT_FALSE(SameIgnoringCase(L"\u00C9", L"\u00E9"));
  EXPECT_FALSE(SameIgnoringCase(L"\u212A", L"k"));  // the kelvin sign
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
