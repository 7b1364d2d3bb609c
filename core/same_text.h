// Compares names without regard to case.
#pragma once

#include <algorithm>
#include <string_view>

namespace Qel::Lumetra::ShellExt {

/// Returns whether two strings are equal apart from the case of the letters A to Z. The locale has no
/// influence.
inline bool SameIgnoringCase(std::wstring_view a, std::wstring_view b) {
  const auto lower = [](wchar_t c) {
    return c >= L'A' && c <= L'Z' ? static_cast<wchar_t>(c - L'A' + L'a') : c;
  };
  return std::ranges::equal(a, b, {}, lower, lower);
}

}  // namespace Qel::Lumetra::ShellExt
