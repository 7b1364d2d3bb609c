// Registers or unregisters the built DLL in the private registry of another process, and terminates itself
// after CHANGES changes, before the next one.
//
//   dying_registration register|unregister REGISTRY CHANGES
//
// Exits with 0 if there were no more changes, with 1 if the DLL failed, and with 3 if it terminated itself.
#include <windows.h>

#include <cstdlib>
#include <string>

#include "dll_registration.h"
#include "registry_reader.h"
#include "registry_writes.h"

int wmain(int count, wchar_t** arguments) {
  using namespace Qel::Lumetra::ShellExt::Testing;
  if (count != 4) return 2;
  const bool isRegistering = std::wstring(arguments[1]) == L"register";
  const PrivateRegistry registry{arguments[2]};
  const std::size_t changes = std::wcstoul(arguments[3], nullptr, 10);

  const DllRegistration server;
  const RegistryWrites writes(server.module(), [changes](std::size_t number) -> LSTATUS {
    if (number == changes) TerminateProcess(GetCurrentProcess(), 3);
    return ERROR_SUCCESS;
  });
  return SUCCEEDED(isRegistering ? server.Register() : server.Unregister()) ? 0 : 1;
}
