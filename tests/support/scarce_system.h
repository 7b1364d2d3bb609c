// A system that runs out of things at a chosen moment, for one loaded module: memory, above all, but also the
// texts, locks and bitmaps that it takes from Windows.
#pragma once

#include <windows.h>

#include <array>
#include <cstdint>

#include "import_patch.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Diverts the module's imports as long as it lives. One at a time; the module is used by one thread at a
/// time.
class ScarceSystem {
 public:
  enum class Then { kRecovers, kStaysEmpty };

  /// What the system lacks.
  enum class Lack { kNothing, kMemory, kOther };

  /// Nothing fails yet.
  explicit ScarceSystem(HMODULE module);
  ~ScarceSystem();
  ScarceSystem(const ScarceSystem&) = delete;
  ScarceSystem& operator=(const ScarceSystem&) = delete;

  /// Lets fail what the module asks for, counted from 0 from now on, and if so chosen all after it.
  static void FailAt(std::int64_t request, Then then);

  /// Lets nothing fail. Returns what has failed first: the C runtime's memory or anything else.
  static Lack Recover();

 private:
  std::array<ImportPatch, 9> patches_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
