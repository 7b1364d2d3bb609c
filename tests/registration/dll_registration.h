// The registration entry points of the built DLL, loaded from any path.
#pragma once

#include <windows.h>

#include <filesystem>

#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {

class DllRegistration {
 public:
  /// Throws std::runtime_error if the DLL does not load.
  explicit DllRegistration(const std::filesystem::path& dll = ServerDll::Path());
  ~DllRegistration() { FreeLibrary(module_); }
  DllRegistration(const DllRegistration&) = delete;
  DllRegistration& operator=(const DllRegistration&) = delete;

  HMODULE module() const { return module_; }
  HRESULT Register() const { return register_(); }
  HRESULT Unregister() const { return unregister_(); }

 private:
  using EntryPoint = HRESULT(WINAPI*)();
  EntryPoint Find(const char* name) const;

  HMODULE module_;
  EntryPoint register_;
  EntryPoint unregister_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
