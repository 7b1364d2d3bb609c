// Reads the registry of Windows, and gives a test a private one.
#pragma once

#include <windows.h>

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns everything in and below `key`, whose path is `name` in the lines. Links to other keys are left
/// out. A value that is neither a string nor a DWORD is read as a string that names its type and size.
RegistryContents ReadRegistry(HKEY key, const std::wstring& name);

/// Gives the process its own HKEY_LOCAL_MACHINE while it exists. Its Software\Classes is the process's
/// HKEY_CLASSES_ROOT. The machine's registry is neither visible nor changed, except for one key in
/// HKEY_CURRENT_USER.
class PrivateRegistry {
 public:
  /// Makes a registry that contains only Software\Classes. The destructor deletes it.
  PrivateRegistry();

  /// Opens the registry of another process, which must outlive this object.
  explicit PrivateRegistry(std::wstring path);

  ~PrivateRegistry();
  PrivateRegistry(const PrivateRegistry&) = delete;
  PrivateRegistry& operator=(const PrivateRegistry&) = delete;

  RegistryContents Contents() const { return ReadRegistry(machine_, L"HKLM"); }

  /// Deletes everything except Software\Classes.
  void Clear();

  /// Returns its path in HKEY_CURRENT_USER.
  const std::wstring& path() const { return path_; }

 private:
  void Open();

  std::wstring path_;
  bool isOwner_;
  HKEY machine_ = nullptr;
  HKEY classes_ = nullptr;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
