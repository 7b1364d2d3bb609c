// Protects the machine's own registrations from a test that registers the DLL, as the machine may be a
// user's.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns a sentence that says why the DLL must not be registered on this machine: the user is not an
/// administrator, or another copy of the DLL is registered. Returns an empty string if it may be registered.
std::string ReasonNotToRegister();

/// Saves the values of other programs that registering the DLL replaces, and restores them when it is
/// destroyed. Must be made before the DLL is registered.
class SavedRegistrations {
 public:
  SavedRegistrations();
  ~SavedRegistrations();
  SavedRegistrations(const SavedRegistrations&) = delete;
  SavedRegistrations& operator=(const SavedRegistrations&) = delete;

 private:
  struct Value {
    std::wstring key;  // in HKEY_LOCAL_MACHINE
    std::wstring name;
    DWORD type = REG_NONE;
    std::vector<BYTE> data;
  };
  std::vector<Value> values_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
