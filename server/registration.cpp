#include "registration.h"

#include <shlobj.h>

#include <array>
#include <new>
#include <string>
#include <string_view>
#include <vector>

#include "script_ids.h"
#include "windows_registry.h"

namespace Qel::Lumetra::ShellExt {
namespace {

class SystemLocaleScope {
 public:
  SystemLocaleScope() : saved_(GetThreadLocale()) { SetThreadLocale(LOCALE_SYSTEM_DEFAULT); }
  ~SystemLocaleScope() { SetThreadLocale(saved_); }
  SystemLocaleScope(const SystemLocaleScope&) = delete;
  SystemLocaleScope& operator=(const SystemLocaleScope&) = delete;

 private:
  LCID saved_;
};

HRESULT LastError() {
  return HRESULT_FROM_WIN32(GetLastError());
}

std::wstring DoubleQuotes(std::wstring_view text) {
  std::wstring doubled;
  for (const wchar_t c : text) doubled.append(c == L'\'' ? 2 : 1, c);
  return doubled;
}

/// Finds the script with the resource identifier `id`. It stays in memory as long as the module is loaded.
HRESULT FindScript(HINSTANCE module, UINT id, std::string_view& script) {
  const HRSRC resource = FindResourceW(module, MAKEINTRESOURCEW(id), L"REGISTRY");
  if (!resource) return LastError();
  const HGLOBAL loaded = LoadResource(module, resource);
  if (!loaded) return LastError();
  script = {static_cast<const char*>(LockResource(loaded)), SizeofResource(module, resource)};
  return S_OK;
}

HRESULT AddModulePath(HINSTANCE instance, std::vector<Replacement>& replacements) {
  std::array<wchar_t, MAX_PATH> buffer{};
  const DWORD length = GetModuleFileNameW(instance, buffer.data(), MAX_PATH);
  if (length == 0) return LastError();
  if (length == MAX_PATH) return HRESULT_FROM_WIN32(ERROR_INSUFFICIENT_BUFFER);
  const std::wstring_view path(buffer.data(), length);
  replacements.push_back({L"Module", DoubleQuotes(path)});
  replacements.push_back({L"Module_Raw", std::wstring(path)});
  return S_OK;
}

HRESULT RunScripts(ScriptDirection direction, HINSTANCE instance, const CQelShellExtModule& module,
                   std::span<const ObjectMapEntry> objectMap) {
  std::vector<Replacement> replacements;
  HRESULT result = module.AddCommonRGSReplacements(replacements);
  if (SUCCEEDED(result)) result = AddModulePath(instance, replacements);

  std::vector<UINT> scripts;
  for (const ObjectMapEntry& entry : objectMap) scripts.push_back(entry.registryScript);
  scripts.insert(direction == ScriptDirection::kRegister ? scripts.begin() : scripts.end(), IDR_MODULE);

  WindowsRegistry registry;
  for (const UINT id : scripts) {
    std::string_view script;
    if (SUCCEEDED(result)) result = FindScript(instance, id, script);
    if (SUCCEEDED(result)) result = RunRegistryScript(script, replacements, direction, registry);
  }
  return result;
}

}  // namespace

HRESULT UpdateRegistration(ScriptDirection direction, HINSTANCE instance, const CQelShellExtModule& module,
                           std::span<const ObjectMapEntry> objectMap) {
  HRESULT result = S_OK;
  try {
    const SystemLocaleScope locale;
    result = RunScripts(direction, instance, module, objectMap);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;  // the caller need not be a C++ program
  }
  // The shell caches the associations of file types. Without this notification it would show the change only
  // after the next log-on.
  if (SUCCEEDED(result)) SHChangeNotify(SHCNE_ASSOCCHANGED, SHCNF_IDLIST, nullptr, nullptr);
  return result;
}

}  // namespace Qel::Lumetra::ShellExt
