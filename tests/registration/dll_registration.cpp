#include "dll_registration.h"

#include <stdexcept>

namespace Qel::Lumetra::ShellExt::Testing {

DllRegistration::DllRegistration(const std::filesystem::path& dll)
    : module_(LoadLibraryW(dll.c_str())),
      register_(Find("DllRegisterServer")),
      unregister_(Find("DllUnregisterServer")) {
  if (!register_ || !unregister_)
    throw std::runtime_error(dll.string() + " does not load, or lacks an export");
}

DllRegistration::EntryPoint DllRegistration::Find(const char* name) const {
  return reinterpret_cast<EntryPoint>(reinterpret_cast<void*>(GetProcAddress(module_, name)));
}

}  // namespace Qel::Lumetra::ShellExt::Testing
