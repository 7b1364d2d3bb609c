// The few changes that a registry script makes to the registry, as an interface: the registrar writes through
// it, WindowsRegistry carries the changes out, and tests put a store of their own in its place.
#pragma once

#include <windows.h>

#include <string>

#include "registry_script.h"

namespace Qel::Lumetra::ShellExt {

/// Keys are named by their root and the path below it, separated by backslashes. Every change is complete
/// in itself; nothing that is missing already is an error to a removal.
class RegistryStore {
 public:
  /// With all the keys on the way to it; a key that is there stays as it is.
  virtual HRESULT CreateKey(RegistryRoot root, const std::wstring& path) = 0;

  /// In a key that exists; an empty name is the key's default value.
  virtual HRESULT SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                           const RegistryData& data) = 0;

  /// The key and everything below it.
  virtual HRESULT DeleteTree(RegistryRoot root, const std::wstring& path) = 0;

  virtual HRESULT DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) = 0;

  /// Leaves a key alone that has a subkey or a value; with `ignoreDefault` its default value does not count.
  virtual HRESULT DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) = 0;

 protected:
  ~RegistryStore() = default;
};

}  // namespace Qel::Lumetra::ShellExt
