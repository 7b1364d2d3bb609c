#include "registry_reader.h"

#include <array>
#include <cstring>
#include <stdexcept>
#include <utility>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

void Check(LSTATUS status, const char* what) {
  if (status != ERROR_SUCCESS)
    throw std::runtime_error(std::string(what) + " failed: " + std::to_string(status));
}

RegistryData ToData(DWORD type, const std::vector<BYTE>& bytes) {
  if (type == REG_DWORD && bytes.size() == sizeof(DWORD)) {
    std::uint32_t number = 0;
    std::memcpy(&number, bytes.data(), sizeof(number));
    return number;
  }
  if (type != REG_SZ) return L"type " + std::to_wstring(type) + L", size " + std::to_wstring(bytes.size());
  std::wstring text(bytes.size() / sizeof(wchar_t), L'\0');
  std::memcpy(text.data(), bytes.data(), text.size() * sizeof(wchar_t));
  if (text.ends_with(L'\0')) text.pop_back();
  return text;
}

void ReadValues(HKEY key, const std::wstring& path, RegistryContents& contents) {
  std::vector<BYTE> bytes(1 << 16);
  std::vector<wchar_t> name(1 << 14);
  for (DWORD i = 0;; ++i) {
    auto nameLength = static_cast<DWORD>(name.size());
    auto size = static_cast<DWORD>(bytes.size());
    DWORD type = 0;
    const LSTATUS status =
        RegEnumValueW(key, i, name.data(), &nameLength, nullptr, &type, bytes.data(), &size);
    if (status == ERROR_NO_MORE_ITEMS) return;
    if (status == ERROR_MORE_DATA) {
      bytes.resize(bytes.size() * 2);
      --i;
      continue;
    }
    Check(status, "RegEnumValueW");
    contents.insert(ValueLine(path, name.data(), ToData(type, {bytes.begin(), bytes.begin() + size})));
  }
}

/// Returns whether a key is a link. The registry view of 32-bit programs links to the keys that it shares.
bool IsLink(HKEY key) {
  DWORD type = REG_NONE;
  return RegQueryValueExW(key, L"SymbolicLinkValue", nullptr, &type, nullptr, nullptr) == ERROR_SUCCESS &&
         type == REG_LINK;
}

std::vector<std::wstring> Subkeys(HKEY key) {
  std::vector<std::wstring> names;
  std::array<wchar_t, 256> name{};
  for (DWORD i = 0;; ++i) {
    auto length = static_cast<DWORD>(name.size());
    const LSTATUS status = RegEnumKeyExW(key, i, name.data(), &length, nullptr, nullptr, nullptr, nullptr);
    if (status == ERROR_NO_MORE_ITEMS) return names;
    Check(status, "RegEnumKeyExW");
    names.emplace_back(name.data());
  }
}

}  // namespace

RegistryContents ReadRegistry(HKEY key, const std::wstring& name) {
  RegistryContents contents;
  std::vector<std::wstring> pending = {L""};
  while (!pending.empty()) {
    const std::wstring path = std::move(pending.back());
    pending.pop_back();
    HKEY opened = nullptr;
    const std::wstring full = path.empty() ? name : name + L'\\' + path;
    const LSTATUS status = RegOpenKeyExW(key, path.c_str(), REG_OPTION_OPEN_LINK, KEY_READ, &opened);
    if (status == ERROR_ACCESS_DENIED ||
        status == ERROR_FILE_NOT_FOUND) {  // accessible to the system only, or deleted meanwhile
      contents.insert(full);
      continue;
    }
    Check(status, "RegOpenKeyExW");
    if (IsLink(opened)) {
      RegCloseKey(opened);
      continue;
    }
    contents.insert(full);
    ReadValues(opened, full, contents);
    for (const std::wstring& subkey : Subkeys(opened)) {
      if (subkey == L"Perflib") continue;  // its performance counters cannot be listed
      pending.push_back(path.empty() ? subkey : path + L'\\' + subkey);
    }
    RegCloseKey(opened);
  }
  return contents;
}

PrivateRegistry::PrivateRegistry()
    : path_(L"Software\\QelShellExtTest-" + std::to_wstring(GetCurrentProcessId())), isOwner_(true) {
  Open();
}

PrivateRegistry::PrivateRegistry(std::wstring path) : path_(std::move(path)), isOwner_(false) {
  Open();
}

PrivateRegistry::~PrivateRegistry() {
  RegOverridePredefKey(HKEY_CLASSES_ROOT, nullptr);
  RegOverridePredefKey(HKEY_LOCAL_MACHINE, nullptr);
  RegCloseKey(classes_);
  RegCloseKey(machine_);
  if (isOwner_) RegDeleteTreeW(HKEY_CURRENT_USER, path_.c_str());
}

void PrivateRegistry::Clear() {
  Check(RegDeleteTreeW(machine_, L"Software"), "RegDeleteTreeW");
  RegCloseKey(classes_);
  RegCloseKey(machine_);
  Open();
}

void PrivateRegistry::Open() {
  const std::wstring classes = path_ + L"\\Software\\Classes";
  Check(RegCreateKeyExW(HKEY_CURRENT_USER, path_.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &machine_,
                        nullptr),
        "RegCreateKeyExW");
  Check(RegCreateKeyExW(HKEY_CURRENT_USER, classes.c_str(), 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &classes_,
                        nullptr),
        "RegCreateKeyExW");
  Check(RegOverridePredefKey(HKEY_LOCAL_MACHINE, machine_), "RegOverridePredefKey");
  Check(RegOverridePredefKey(HKEY_CLASSES_ROOT, classes_), "RegOverridePredefKey");
}

}  // namespace Qel::Lumetra::ShellExt::Testing
