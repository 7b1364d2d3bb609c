// The changes that a registry script makes to the registry, as an interface. The registrar writes through it,
// WindowsRegistry carries the changes out, and tests provide a store of their own.
#pragma once

#include <windows.h>

#include <string>

#include "registry_script.h"

namespace Qel::Lumetra::ShellExt {

/// A key is identified by its root and the path below it, whose names are separated by backslashes. Every
/// call opens and closes the key itself. Every function returns S_OK or the failure; deleting something that
/// is already missing succeeds.
class RegistryStore {
 public:
  /// Creates the key and all missing keys above it. An existing key keeps its contents.
  virtual HRESULT CreateKey(RegistryRoot root, const std::wstring& path) = 0;

  /// Sets a value of an existing key; an empty name is the key's default value.
  virtual HRESULT SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                           const RegistryData& data) = 0;

  /// Deletes the key and everything below it.
  virtual HRESULT DeleteTree(RegistryRoot root, const std::wstring& path) = 0;

  virtual HRESULT DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) = 0;

  /// Deletes a key that has no subkey and no value. With `ignoreDefault` its default value does not count.
  /// Any other key stays, which is a success.
  virtual HRESULT DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) = 0;

 protected:
  ~RegistryStore() = default;
};

}  // namespace Qel::Lumetra::ShellExt
