// A registry in memory, for tests of the registry scripts. It ignores the case of names but preserves it, and
// can make any change fail.
#pragma once

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <utility>

#include "registry_contents.h"
#include "registry_store.h"

namespace Qel::Lumetra::ShellExt::Testing {

class MemoryRegistry final : public RegistryStore {
 public:
  enum class ClassesRoot {
    kApart,         ///< HKCR is separate, so that tests see what was written through it
    kWithinMachine  ///< HKCR is HKLM\Software\Classes, as on a machine
  };
  explicit MemoryRegistry(ClassesRoot classesRoot = ClassesRoot::kApart) : classesRoot_(classesRoot) {}

  HRESULT CreateKey(RegistryRoot root, const std::wstring& path) override;
  HRESULT SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                   const RegistryData& data) override;
  HRESULT DeleteTree(RegistryRoot root, const std::wstring& path) override;
  HRESULT DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) override;
  HRESULT DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) override;

  RegistryContents Contents() const;

  /// Makes every change after the next `changes` changes fail with E_ACCESSDENIED and do nothing.
  void FailAfter(std::size_t changes) { changesLeft_ = changes; }
  void NeverFail() { changesLeft_.reset(); }

 private:
  struct Value {
    std::wstring name;
    RegistryData data;
  };
  struct Key {
    std::wstring path;
    std::map<std::wstring, Value> values;  // by name, in lower case
  };
  using Keys = std::map<std::wstring, Key>;  // by path, in lower case

  std::wstring FullPath(RegistryRoot root, const std::wstring& path) const;
  Keys::iterator Find(RegistryRoot root, const std::wstring& path);
  bool Fails();

  ClassesRoot classesRoot_;
  Keys keys_;
  std::optional<std::size_t> changesLeft_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
