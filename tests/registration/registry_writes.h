// Observes the calls by which a module changes the registry, and lets a test decide their results.
#pragma once

#include <windows.h>

#include <array>
#include <cstddef>
#include <functional>

#include "import_patch.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Only one may exist at a time.
class RegistryWrites {
 public:
  /// Called before each change with the number of changes before it. If it returns ERROR_SUCCESS the change
  /// is made, otherwise the change fails with that result.
  using Decide = std::function<LSTATUS(std::size_t)>;

  RegistryWrites(HMODULE module, Decide decide);
  ~RegistryWrites();
  RegistryWrites(const RegistryWrites&) = delete;
  RegistryWrites& operator=(const RegistryWrites&) = delete;

  /// Returns how many changes have been requested.
  std::size_t count() const { return count_; }

  /// Returns the decision of the current object for the next change. The replaced imports call this.
  static LSTATUS AskCurrent();

 private:
  Decide decide_;
  std::size_t count_ = 0;
  std::array<ImportPatch, 5> patches_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
