// The registry of Windows for tests: what it holds, and one of the test's own.
#pragma once

#include <windows.h>

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Everything at and below `key`, which the lines call `name`; links to other keys are left out. Values other
/// than strings and DWORDs are read as strings of their type and size.
RegistryContents ReadRegistry(HKEY key, const std::wstring& name);

/// As long as this lives, the process has a HKEY_LOCAL_MACHINE of its own, whose Software\Classes is its
/// HKEY_CLASSES_ROOT. The machine's registry is neither seen nor changed, but for a key of the user's.
class PrivateRegistry {
 public:
  /// Empty at first but for Software\Classes, and deleted in the end.
  PrivateRegistry();

  /// The one that another process made, which is to outlive this.
  explicit PrivateRegistry(std::wstring path);

  ~PrivateRegistry();
  PrivateRegistry(const PrivateRegistry&) = delete;
  PrivateRegistry& operator=(const PrivateRegistry&) = delete;

  RegistryContents Contents() const { return ReadRegistry(machine_, L"HKLM"); }

  /// Empty again but for Software\Classes.
  void Clear();

  /// Where it stands in HKEY_CURRENT_USER.
  const std::wstring& path() const { return path_; }

 private:
  void Open();

  std::wstring path_;
  bool isOwner_;
  HKEY machine_ = nullptr;
  HKEY classes_ = nullptr;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
