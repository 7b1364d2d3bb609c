// Makes calls of one loaded module fail at a chosen moment: its allocations, and the strings, locks and
// bitmaps that it requests from Windows.
#pragma once

#include <windows.h>

#include <array>
#include <cstdint>

#include "import_patch.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Replaces the module's imports while it exists. Only one may exist at a time, and only one thread may use
/// the module.
class ScarceSystem {
 public:
  enum class Then { kRecovers, kKeepsFailing };

  /// What failed first: an allocation of the C runtime, or another request.
  enum class Lack { kNothing, kMemory, kOther };

  /// Replaces the imports. Nothing fails before FailAt.
  explicit ScarceSystem(HMODULE module);
  ~ScarceSystem();
  ScarceSystem(const ScarceSystem&) = delete;
  ScarceSystem& operator=(const ScarceSystem&) = delete;

  /// Makes the request with the index `request` fail, and with kKeepsFailing all later ones too. The next
  /// request has the index 0.
  static void FailAt(std::int64_t request, Then then);

  /// Makes all requests succeed again. Returns what failed first since FailAt.
  static Lack Recover();

 private:
  std::array<ImportPatch, 9> patches_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
