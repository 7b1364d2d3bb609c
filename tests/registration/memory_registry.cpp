#include "memory_registry.h"

#include <algorithm>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

// The keys below a key sort between its path followed by a backslash and its path followed by this character.
constexpr wchar_t kAfterBackslash = L'\\' + 1;

std::wstring Lower(std::wstring text) {
  std::ranges::transform(text, text.begin(), [](wchar_t c) {
    return c >= L'A' && c <= L'Z' ? static_cast<wchar_t>(c + (L'a' - L'A')) : c;
  });
  return text;
}

}  // namespace

HRESULT MemoryRegistry::CreateKey(RegistryRoot root, const std::wstring& path) {
  if (Fails()) return E_ACCESSDENIED;
  const std::wstring full = FullPath(root, path);
  for (std::size_t end = full.find(L'\\');; end = full.find(L'\\', end + 1)) {
    const std::wstring level = full.substr(0, end);
    auto& key = keys_[Lower(level)];
    if (key.path.empty()) {
      const std::size_t leaf = level.rfind(L'\\');
      key.path = leaf == std::wstring::npos
                     ? level
                     : keys_.at(Lower(level.substr(0, leaf))).path + level.substr(leaf);
    }
    if (end == std::wstring::npos) return S_OK;
  }
}

HRESULT MemoryRegistry::SetValue(RegistryRoot root, const std::wstring& path, const std::wstring& name,
                                 const RegistryData& data) {
  if (Fails()) return E_ACCESSDENIED;
  const auto key = Find(root, path);
  if (key == keys_.end()) return E_INVALIDARG;
  Value& value = key->second.values.try_emplace(Lower(name), Value{name, {}}).first->second;
  value.data = data;
  return S_OK;
}

HRESULT MemoryRegistry::DeleteTree(RegistryRoot root, const std::wstring& path) {
  if (Fails()) return E_ACCESSDENIED;
  const std::wstring top = Lower(FullPath(root, path));
  keys_.erase(top);
  keys_.erase(keys_.lower_bound(top + L'\\'), keys_.lower_bound(top + kAfterBackslash));
  return S_OK;
}

HRESULT MemoryRegistry::DeleteValue(RegistryRoot root, const std::wstring& path, const std::wstring& name) {
  if (Fails()) return E_ACCESSDENIED;
  const auto key = Find(root, path);
  if (key != keys_.end()) key->second.values.erase(Lower(name));
  return S_OK;
}

HRESULT MemoryRegistry::DeleteEmptyKey(RegistryRoot root, const std::wstring& path, bool ignoreDefault) {
  if (Fails()) return E_ACCESSDENIED;
  const auto key = Find(root, path);
  if (key == keys_.end()) return S_OK;
  const auto& values = key->second.values;
  const bool hasSubkeys =
      keys_.lower_bound(key->first + L'\\') != keys_.lower_bound(key->first + kAfterBackslash);
  if (!hasSubkeys && values.size() == (ignoreDefault ? values.count(L"") : 0)) keys_.erase(key);
  return S_OK;
}

RegistryContents MemoryRegistry::Contents() const {
  RegistryContents contents;
  for (const auto& [folded, key] : keys_) {
    contents.insert(key.path);
    for (const auto& [foldedName, value] : key.values) {
      contents.insert(ValueLine(key.path, value.name, value.data));
    }
  }
  return contents;
}

std::wstring MemoryRegistry::FullPath(RegistryRoot root, const std::wstring& path) const {
  if (root == RegistryRoot::kLocalMachine) return L"HKLM\\" + path;
  return (classesRoot_ == ClassesRoot::kApart ? L"HKCR\\" : L"HKLM\\Software\\Classes\\") + path;
}

MemoryRegistry::Keys::iterator MemoryRegistry::Find(RegistryRoot root, const std::wstring& path) {
  return keys_.find(Lower(FullPath(root, path)));
}

bool MemoryRegistry::Fails() {
  if (!changesLeft_) return false;
  if (*changesLeft_ == 0) return true;
  --*changesLeft_;
  return false;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
