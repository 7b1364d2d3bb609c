#include "windows_registry.h"

#include "handle_owner.h"

namespace Qel::Lumetra::ShellExt {
namespace {

HKEY RootKey(RegistryRoot root) {
  return root == RegistryRoot::kClassesRoot ? HKEY_CLASSES_ROOT : HKEY_LOCAL_MACHINE;
}

HRESULT FromStatus(LSTATUS status) {
  return HRESULT_FROM_WIN32(static_cast<DWORD>(status));
}

HRESULT FromRemoval(LSTATUS status) {
  const bool isGone = status == ERROR_FILE_NOT_FOUND || status == ERROR_PATH_NOT_FOUND;
  return isGone ? S_OK : FromStatus(status);
}

}  // namespace

HRESULT WindowsRegistry::CreateKey(RegistryRoot root, const std::wstring& path) {
  Com::OwnedKey key;
  return FromStatus(RegCreateKeyExW(RootKey(root), path.c_str(), 0, nullptr, REG_OPTION_NON_VOLATILE,
                                    KEY_SET_VALUE, nullptr, key.Put(), nullptr));
}

HRESULT WindowsRegistry::SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                                  const RegistryData& data) {
  Com::OwnedKey key;
  const LSTATUS opened = RegOpenKeyExW(RootKey(root), path.c_str(), 0, KEY_SET_VALUE, key.Put());
  if (opened != ERROR_SUCCESS) return FromStatus(opened);

  const auto set = [&](DWORD type, const void* bytes, std::size_t size) {
    return FromStatus(RegSetValueExW(key.Get(), name.c_str(), 0, type, static_cast<const BYTE*>(bytes),
                                     static_cast<DWORD>(size)));
  };
  if (const auto* number = std::get_if<std::uint32_t>(&data)) {
    return set(REG_DWORD, number, sizeof(*number));
  }
  const auto& text = std::get<std::wstring>(data);
  return set(REG_SZ, text.c_str(), (text.size() + 1) * sizeof(wchar_t));
}

HRESULT WindowsRegistry::DeleteTree(RegistryRoot root, const std::wstring& path) {
  return FromRemoval(RegDeleteTreeW(RootKey(root), path.c_str()));
}

HRESULT WindowsRegistry::DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) {
  Com::OwnedKey key;
  const LSTATUS opened = RegOpenKeyExW(RootKey(root), path.c_str(), 0, KEY_SET_VALUE, key.Put());
  if (opened != ERROR_SUCCESS) return FromRemoval(opened);
  return FromRemoval(RegDeleteValueW(key.Get(), name.c_str()));
}

HRESULT WindowsRegistry::DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) {
  DWORD subkeys = 0;
  DWORD values = 0;
  {
    Com::OwnedKey key;
    const LSTATUS opened = RegOpenKeyExW(RootKey(root), path.c_str(), 0, KEY_QUERY_VALUE, key.Put());
    if (opened != ERROR_SUCCESS) return FromRemoval(opened);
    const LSTATUS counted = RegQueryInfoKeyW(key.Get(), nullptr, nullptr, nullptr, &subkeys, nullptr, nullptr,
                                             &values, nullptr, nullptr, nullptr, nullptr);
    if (counted != ERROR_SUCCESS) return FromStatus(counted);
    const bool hasDefault =
        RegQueryValueExW(key.Get(), nullptr, nullptr, nullptr, nullptr, nullptr) == ERROR_SUCCESS;
    if (ignoreDefault && hasDefault) --values;
  }
  if (subkeys > 0 || values > 0) return S_OK;
  return FromRemoval(RegDeleteKeyExW(RootKey(root), path.c_str(), 0, 0));
}

}  // namespace Qel::Lumetra::ShellExt
