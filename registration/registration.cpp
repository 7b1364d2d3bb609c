#include "registration.h"

#include <shlobj.h>

#include <array>
#include <new>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "registrar.h"
#include "windows_registry.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr UINT kModuleScript = 101;

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

/// The text lives as long as the module is loaded.
HRESULT FindScript(HINSTANCE module, UINT id, std::string_view& script) {
  const HRSRC resource = FindResourceW(module, MAKEINTRESOURCEW(id), L"REGISTRY");
  if (!resource) return LastError();
  const HGLOBAL loaded = LoadResource(module, resource);
  if (!loaded) return LastError();
  script = {static_cast<const char*>(LockResource(loaded)), SizeofResource(module, resource)};
  return S_OK;
}

/// The scripts of one server, run in one direction.
class ScriptRunner {
 public:
  ScriptRunner(const ServerRegistration& server, ScriptDirection direction)
      : server_(server),
        direction_(direction),
        replacements_(server.replacements.begin(), server.replacements.end()) {}

  HRESULT AddModulePath() {
    std::array<wchar_t, MAX_PATH> buffer{};
    const DWORD length = GetModuleFileNameW(server_.module, buffer.data(), MAX_PATH);
    if (length == 0) return LastError();
    if (length == MAX_PATH) return HRESULT_FROM_WIN32(ERROR_INSUFFICIENT_BUFFER);
    const std::wstring_view path(buffer.data(), length);
    replacements_.push_back({L"Module", DoubleQuotes(path)});
    replacements_.push_back({L"Module_Raw", std::wstring(path)});
    return S_OK;
  }

  HRESULT RunModuleScript() { return Run(kModuleScript); }

  HRESULT RunClassScripts() {
    HRESULT result = S_OK;
    for (const UINT id : server_.classScripts) {
      result = Run(id);
      if (FAILED(result)) break;
    }
    return result;
  }

 private:
  HRESULT Run(UINT id) {
    std::string_view script;
    const HRESULT found = FindScript(server_.module, id, script);
    return FAILED(found) ? found : RunRegistryScript(script, replacements_, direction_, registry_);
  }

  const ServerRegistration& server_;
  ScriptDirection direction_;
  std::vector<Replacement> replacements_;
  WindowsRegistry registry_;
};

HRESULT RunScripts(const ServerRegistration& server, ScriptDirection direction) {
  ScriptRunner runner(server, direction);
  HRESULT result = runner.AddModulePath();
  const bool isRegistering = direction == ScriptDirection::kRegister;
  if (SUCCEEDED(result) && isRegistering) result = runner.RunModuleScript();
  if (SUCCEEDED(result)) result = runner.RunClassScripts();
  if (SUCCEEDED(result) && !isRegistering) result = runner.RunModuleScript();
  return result;
}

/// The caller is no C++ program, so memory that runs out becomes a result here.
HRESULT UpdateRegistration(const ServerRegistration& server, ScriptDirection direction) {
  HRESULT result = S_OK;
  try {
    const SystemLocaleScope locale;
    result = RunScripts(server, direction);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  // The shell keeps what it knows of file types; without this it would show the change at the next log-on.
  if (SUCCEEDED(result)) SHChangeNotify(SHCNE_ASSOCCHANGED, SHCNF_IDLIST, nullptr, nullptr);
  return result;
}

}  // namespace

HRESULT RegisterServer(const ServerRegistration& server) {
  return UpdateRegistration(server, ScriptDirection::kRegister);
}

HRESULT UnregisterServer(const ServerRegistration& server) {
  return UpdateRegistration(server, ScriptDirection::kUnregister);
}

}  // namespace Qel::Lumetra::ShellExt
