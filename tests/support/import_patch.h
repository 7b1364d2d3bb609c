// Replaces a function that a loaded module imports with a function of the test. The test sees how the module
// uses Windows and can make a call fail. Calls by other modules are not affected.
#pragma once

#include <windows.h>

namespace Qel::Lumetra::ShellExt::Testing {

class ImportPatch {
 public:
  /// `replacement` has the signature of the function `name`, which `module` may import from any DLL. Throws
  /// std::runtime_error if the module does not import it. The module must stay loaded while this object
  /// exists.
  template <class Function>
  ImportPatch(HMODULE module, const char* name, Function* replacement)
      : ImportPatch(module, name, reinterpret_cast<void*>(replacement)) {}
  ImportPatch(HMODULE module, const char* name, void* replacement);
  ~ImportPatch();
  ImportPatch(const ImportPatch&) = delete;
  ImportPatch& operator=(const ImportPatch&) = delete;

 private:
  void** slot_;
  void* original_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
