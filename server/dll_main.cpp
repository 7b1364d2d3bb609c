// The functions that Windows and COM call in the DLL.
#include <windows.h>

#include "object_map.h"
#include "qel_shell_ext_module.h"
#include "registration.h"

// The linker defines this symbol. Its address is the module's instance handle.
extern "C" IMAGE_DOS_HEADER __ImageBase;

using Qel::Lumetra::ShellExt::ObjectMap;
using Qel::Lumetra::ShellExt::ScriptDirection;
using Qel::Lumetra::ShellExt::UpdateRegistration;

namespace {

const auto kInstance = reinterpret_cast<HINSTANCE>(&__ImageBase);

// Constructed before DllMain runs, destroyed when the DLL is unloaded.
CQelShellExtModule g_module(ObjectMap());

}  // namespace

extern "C" BOOL WINAPI DllMain(HINSTANCE, DWORD reason, void*) {
  return reason != DLL_PROCESS_ATTACH || !g_module.initFailed();
}

STDAPI DllGetClassObject(REFCLSID clsid, REFIID iid, void** classObject) {
  return g_module.GetClassObject(clsid, iid, classObject);
}

STDAPI DllCanUnloadNow() {
  return g_module.GetLockCount() == 0 ? S_OK : S_FALSE;
}

STDAPI DllRegisterServer() {
  return UpdateRegistration(ScriptDirection::kRegister, kInstance, g_module, ObjectMap());
}

STDAPI DllUnregisterServer() {
  return UpdateRegistration(ScriptDirection::kUnregister, kInstance, g_module, ObjectMap());
}
