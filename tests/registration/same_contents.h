// Compares registry contents in an assertion.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns success if both are equal. The failure lists only the lines that differ.
inline ::testing::AssertionResult Same(const RegistryContents& actual, const RegistryContents& expected) {
  const RegistryContents missing = Without(expected, actual);
  const RegistryContents excess = Without(actual, expected);
  if (missing.empty() && excess.empty()) return ::testing::AssertionSuccess();
  auto failure = ::testing::AssertionFailure();
  for (const std::wstring& line : missing) failure << "\n  missing: " << line;
  for (const std::wstring& line : excess) failure << "\n  unexpected: " << line;
  return failure;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
