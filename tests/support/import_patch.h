// Puts a function of the test in the place of one that a loaded module imports, so that a test sees how the
// module uses Windows and can make it fail. Only that module's own calls are diverted.
#pragma once

#include <windows.h>

namespace Qel::Lumetra::ShellExt::Testing {

class ImportPatch {
 public:
  /// `replacement` has the signature of the function `name`, which `module` imports from whatever DLL.
  /// Throws std::runtime_error if it does not import it. The module stays loaded as long as this lives.
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
