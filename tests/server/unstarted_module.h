// Maps a DLL into the process without starting it. A test can then call its entry point and see every call
// that the entry point makes.
#pragma once

#include <windows.h>

#include <cstddef>
#include <filesystem>
#include <map>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Binds the imports to stubs that count each call and pass it on. The process must not load the DLL in the
/// ordinary way while this exists.
class UnstartedModule {
 public:
  /// Throws std::runtime_error if the DLL cannot be mapped, or if one of its imports does not exist.
  explicit UnstartedModule(const std::filesystem::path& dll);
  ~UnstartedModule();
  UnstartedModule(const UnstartedModule&) = delete;
  UnstartedModule& operator=(const UnstartedModule&) = delete;

  HMODULE module() const { return module_; }

  /// Calls the entry point with `reason`, as the system does.
  BOOL Notify(DWORD reason);

  /// Returns how often the module has called each imported function since the last TakeCalls. Functions
  /// without a call are left out.
  std::map<std::string, int> TakeCalls();

 private:
  struct Stub;

  void BindImports();

  HMODULE module_;
  Stub* stubs_ = nullptr;  // executable memory
  std::size_t count_ = 0;
  std::vector<std::string> names_;  // the function names of the stubs
  std::vector<HMODULE> libraries_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
