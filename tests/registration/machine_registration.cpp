#include "machine_registration.h"

#include <shlobj.h>

#include <array>
#include <filesystem>
#include <system_error>

#include "expected_registration.h"
#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr wchar_t kServerKey[] =
    L"Software\\Classes\\CLSID\\{79E696A1-2FA5-4B3E-9610-D5F760417E62}\\InprocServer32";

/// Returns the path of the registered DLL, or an empty path.
std::filesystem::path RegisteredDll() {
  std::array<wchar_t, 1024> path{};
  DWORD size = sizeof path;
  const LSTATUS status =
      RegGetValueW(HKEY_LOCAL_MACHINE, kServerKey, nullptr, RRF_RT_REG_SZ, nullptr, path.data(), &size);
  return status == ERROR_SUCCESS ? path.data() : L"";
}

}  // namespace

std::string ReasonNotToRegister() {
  if (!IsUserAnAdmin()) return "Only an administrator can register the extension.";
  const std::filesystem::path registered = RegisteredDll();
  std::error_code ignored;
  if (!std::filesystem::exists(registered, ignored) ||
      std::filesystem::equivalent(registered, ServerDll::Path(), ignored)) {
    return {};
  }
  return "The extension is installed on this computer. Uninstall it first.";
}

SavedRegistrations::SavedRegistrations() {
  constexpr std::wstring_view kMachine = L"HKLM\\";
  for (const std::wstring& line : ExpectedAfterRegistering(L"")) {
    const std::size_t keyEnd = line.find(L" : ");
    const std::size_t nameEnd = line.find(L" = ");
    if (keyEnd == std::wstring::npos || nameEnd == std::wstring::npos) continue;
    Value value;
    value.key = line.substr(kMachine.size(), keyEnd - kMachine.size());
    value.name = line.substr(keyEnd + 3, nameEnd - keyEnd - 3);
    if (value.name == L"@") value.name.clear();
    value.data.resize(1 << 16);
    auto size = static_cast<DWORD>(value.data.size());
    if (RegGetValueW(HKEY_LOCAL_MACHINE, value.key.c_str(), value.name.c_str(), RRF_RT_ANY | RRF_NOEXPAND,
                     &value.type, value.data.data(), &size) != ERROR_SUCCESS) {
      continue;
    }
    value.data.resize(size);
    values_.push_back(std::move(value));
  }
}

SavedRegistrations::~SavedRegistrations() {
  for (const Value& value : values_) {
    RegSetKeyValueW(HKEY_LOCAL_MACHINE, value.key.c_str(), value.name.c_str(), value.type, value.data.data(),
                    static_cast<DWORD>(value.data.size()));
  }
}

}  // namespace Qel::Lumetra::ShellExt::Testing
