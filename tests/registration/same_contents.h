// The comparison of registry contents as an assertion.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Equal, or else only the lines that are missing or too many.
inline ::testing::AssertionResult Same(const RegistryContents& actual, const RegistryContents& expected) {
  const RegistryContents missing = Without(expected, actual);
  const RegistryContents excess = Without(actual, expected);
  if (missing.empty() && excess.empty()) return ::testing::AssertionSuccess();
  auto failure = ::testing::AssertionFailure();
  for (const std::wstring& line : missing) failure << "\n  missing: " << line;
  for (const std::wstring& line : excess) failure << "\n  too many: " << line;
  return failure;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
