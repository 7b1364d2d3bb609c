#include "registrar.h"

#include <algorithm>
#include <array>
#include <string>
#include <vector>

#include "same_text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::array<std::wstring_view, 12> kSharedKeys = {L"AppID",    L"CLSID",     L"Component Categories",
                                                           L"FileType", L"Interface", L"Hardware",
                                                           L"Mime",     L"SAM",       L"SECURITY",
                                                           L"SYSTEM",   L"Software",  L"TypeLib"};

KeyMark EffectiveMark(const ScriptKey& key) {
  const bool isShared = std::ranges::any_of(
      kSharedKeys, [&](std::wstring_view name) { return SameIgnoringCase(key.name, name); });
  return isShared ? KeyMark::kNoRemove : key.mark;
}

/// The path from a root to the current key while a script is traversed.
class KeyPath {
 public:
  std::size_t depth() const { return open_.size(); }
  const ScriptKey& key() const { return *open_.back().key; }
  const std::wstring& text() const { return text_; }

  void Enter(const ScriptKey& key) {
    open_.push_back({&key, text_.size()});
    if (open_.size() > 1) text_ += L'\\';
    text_ += key.name;
  }

  void Leave() {
    text_.resize(open_.back().parentLength);
    open_.pop_back();
  }

 private:
  struct Level {
    const ScriptKey* key;
    std::size_t parentLength;
  };
  std::vector<Level> open_;
  std::wstring text_;
};

HRESULT WriteKey(const ScriptKey& key, const std::wstring& path, RegistryStore& store) {
  HRESULT result = S_OK;
  if (EffectiveMark(key) == KeyMark::kForceRemove) result = store.DeleteTree(key.root, path);
  if (SUCCEEDED(result)) result = store.CreateKey(key.root, path);
  if (SUCCEEDED(result) && key.defaultValue) {
    result = store.SetValue(key.root, path, L"", *key.defaultValue);
  }
  for (const ScriptValue& value : key.values) {
    if (FAILED(result)) break;
    result = store.SetValue(key.root, path, value.name, value.data);
  }
  return result;
}

/// Removes a key as its mark requires. The keys inside it have already been handled, or are deleted with it.
HRESULT RemoveKey(const ScriptKey& key, const std::wstring& path, RegistryStore& store) {
  const KeyMark mark = EffectiveMark(key);
  if (mark == KeyMark::kForceRemove) return store.DeleteTree(key.root, path);

  HRESULT result = S_OK;
  for (const ScriptValue& value : key.values) {
    result = store.DeleteValue(key.root, path, value.name);
    if (FAILED(result)) return result;
  }
  if (mark == KeyMark::kNone) result = store.DeleteEmptyKey(key.root, path, key.defaultValue.has_value());
  return result;
}

HRESULT Register(const RegistryScript& script, RegistryStore& store) {
  KeyPath path;
  HRESULT result = S_OK;
  for (const ScriptKey& key : script) {
    while (path.depth() > key.depth) path.Leave();
    path.Enter(key);
    result = WriteKey(key, path.text(), store);
    if (FAILED(result)) break;
  }
  return result;
}

/// Removes inner keys before outer ones, because a key can only be deleted once the keys in it are gone.
HRESULT Unregister(const RegistryScript& script, RegistryStore& store) {
  KeyPath path;
  const auto removeDownTo = [&](std::size_t depth) {
    HRESULT result = S_OK;
    while (SUCCEEDED(result) && path.depth() > depth) {
      result = RemoveKey(path.key(), path.text(), store);
      path.Leave();
    }
    return result;
  };
  const ScriptKey* whole = nullptr;  // deleted together with all the keys inside it
  for (const ScriptKey& key : script) {
    if (whole && key.depth > whole->depth) continue;
    const HRESULT result = removeDownTo(key.depth);
    if (FAILED(result)) return result;
    path.Enter(key);
    whole = EffectiveMark(key) == KeyMark::kForceRemove ? &key : nullptr;
  }
  return removeDownTo(0);
}

}  // namespace

HRESULT RunRegistryScript(std::string_view text, std::span<const Replacement> replacements,
                          ScriptDirection direction, RegistryStore& store) {
  const auto script = ParseRegistryScript(text, replacements);
  if (!script) return kInvalidScript;
  return direction == ScriptDirection::kRegister ? Register(*script, store) : Unregister(*script, store);
}

}  // namespace Qel::Lumetra::ShellExt
