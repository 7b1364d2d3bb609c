// A DLL that is mapped into the process but not started, so that a test can start it by hand and see every
// call that its entry point makes.
#pragma once

#include <windows.h>

#include <cstddef>
#include <filesystem>
#include <map>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Its imports are bound to stubs which count and call on. While it lives, the process must not have loaded
/// the DLL in the ordinary way.
class UnstartedModule {
 public:
  /// Throws std::runtime_error if the DLL cannot be mapped or something that it imports is not there.
  explicit UnstartedModule(const std::filesystem::path& dll);
  ~UnstartedModule();
  UnstartedModule(const UnstartedModule&) = delete;
  UnstartedModule& operator=(const UnstartedModule&) = delete;

  HMODULE module() const { return module_; }

  /// Calls the entry point as the system does when something happens that `reason` names.
  BOOL Notify(DWORD reason);

  /// How often the module has called each imported function since this was last asked; without those that it
  /// has not called.
  std::map<std::string, int> TakeCalls();

 private:
  struct Stub;

  void BindImports();

  HMODULE module_;
  Stub* stubs_ = nullptr;  // executable memory
  std::size_t count_ = 0;
  std::vector<std::string> names_;  // of the stubs
  std::vector<HMODULE> libraries_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
