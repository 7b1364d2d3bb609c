// The Windows registry as a RegistryStore.
#pragma once

#include "registry_store.h"

namespace Qel::Lumetra::ShellExt {

/// Changes HKEY_CLASSES_ROOT and HKEY_LOCAL_MACHINE in the process's own view, so a path into the 32-bit view
/// must contain Wow6432Node. Failures are the registry's errors as HRESULTs.
class WindowsRegistry final : public RegistryStore {
 public:
  HRESULT CreateKey(RegistryRoot root, const std::wstring& path) override;
  HRESULT SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                   const RegistryData& data) override;
  HRESULT DeleteTree(RegistryRoot root, const std::wstring& path) override;
  HRESULT DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) override;
  HRESULT DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) override;
};

}  // namespace Qel::Lumetra::ShellExt
