// What a test has to mind that registers the DLL on the machine it runs on, which may be somebody's.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

/// Says in a sentence why the DLL must not be registered on this machine, because that takes an administrator
/// or another copy of it is registered. Empty if it may be.
std::string WhyNotToRegister();

/// Keeps what others have registered in the values that registering the DLL replaces, and puts it back when
/// this goes. Made before the DLL is registered.
class OthersRegistrations {
 public:
  OthersRegistrations();
  ~OthersRegistrations();
  OthersRegistrations(const OthersRegistrations&) = delete;
  OthersRegistrations& operator=(const OthersRegistrations&) = delete;

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
