// The calls by which a module changes the registry, seen and decided by a test.
#pragma once

#include <windows.h>

#include <array>
#include <cstddef>
#include <functional>

#include "import_patch.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// One at a time.
class RegistryWrites {
 public:
  /// Is asked before each change with the number of those before it; the change is made if the answer is
  /// ERROR_SUCCESS, and fails with the answer otherwise.
  using Decide = std::function<LSTATUS(std::size_t)>;

  RegistryWrites(HMODULE module, Decide decide);
  ~RegistryWrites();
  RegistryWrites(const RegistryWrites&) = delete;
  RegistryWrites& operator=(const RegistryWrites&) = delete;

  /// How many changes have been asked for.
  std::size_t count() const { return count_; }

  /// Used by the replacements of the imports.
  static LSTATUS AskCurrent();

 private:
  Decide decide_;
  std::size_t count_ = 0;
  std::array<ImportPatch, 5> patches_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
