#include "registered_handlers.h"

#include <cstddef>
#include <iterator>

#include "class_ids.h"
#include "file_kinds.h"
#include "handle_owner.h"
#include "registry_values.h"
#include "shell_requests.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

struct ShellHandler {
  const wchar_t* role;
  const wchar_t* key;    // below ShellEx
  const wchar_t* rival;  // below ShellEx: a newer interface for the same purpose, which the shell prefers
};

constexpr ShellHandler kShellHandlers[] = {
    {L"thumbnail", L"{BB2E617C-0920-11D1-9A0B-00C04FC2D6C1}", L"{E357FCCD-A995-4576-B01F-234630154E96}"},
    {L"tip", L"{00021500-0000-0000-C000-000000000046}", nullptr},
    {L"property sets", L"PropertyHandler", nullptr},
};

constexpr std::size_t kMaxKeyCharacters = 255;  // the limit of Windows for the name of a key

constexpr const wchar_t* kPropertyHandlers =
    LR"(SOFTWARE\Microsoft\Windows\CurrentVersion\PropertySystem\PropertyHandlers\)";

/// Returns the absolute path. Returns an empty string unchanged, and a bare file name, which the system looks
/// up in its folders.
std::wstring FullPath(const std::wstring& path) {
  return path.find(L'\\') == std::wstring::npos ? path : AbsolutePath(path);
}

/// Returns the key in which an administrator, the user or a program has blocked the class; an empty string if
/// there is none.
std::wstring BlockingKey(const std::wstring& clsid) {
  constexpr const wchar_t* kBlocked =
      LR"(Software\Microsoft\Windows\CurrentVersion\Shell Extensions\Blocked)";
  if (HasValue(HKEY_LOCAL_MACHINE, kBlocked, clsid)) return std::wstring(L"HKEY_LOCAL_MACHINE\\") + kBlocked;
  if (HasValue(HKEY_CURRENT_USER, kBlocked, clsid)) return std::wstring(L"HKEY_CURRENT_USER\\") + kBlocked;
  return {};
}

/// Returns whether a policy allows only approved classes and this class is not in the list of those.
bool IsUnapproved(const std::wstring& clsid) {
  constexpr const wchar_t* kPolicies = LR"(Software\Microsoft\Windows\CurrentVersion\Policies\Explorer)";
  constexpr const wchar_t* kEnforced = L"EnforceShellExtensionSecurity";
  constexpr const wchar_t* kApproved =
      LR"(Software\Microsoft\Windows\CurrentVersion\Shell Extensions\Approved)";
  const bool isEnforced = NumberValue(HKEY_LOCAL_MACHINE, kPolicies, kEnforced) != 0 ||
                          NumberValue(HKEY_CURRENT_USER, kPolicies, kEnforced) != 0;
  return isEnforced && !HasValue(HKEY_LOCAL_MACHINE, kApproved, clsid) &&
         !HasValue(HKEY_CURRENT_USER, kApproved, clsid);
}

/// Returns the keys of HKEY_CLASSES_ROOT below which the shell looks for a handler, in the order of
/// precedence: the key of the type that the user, or else a program, has chosen for the file-name extension,
/// then the key of that extension.
std::vector<std::wstring> ParentsOfHandlers(const std::wstring& extension) {
  std::wstring type = TextValue(
      HKEY_CURRENT_USER,
      LR"(Software\Microsoft\Windows\CurrentVersion\Explorer\FileExts\)" + extension + L"\\UserChoice",
      L"ProgId");
  if (type.empty()) type = TextValue(HKEY_CLASSES_ROOT, extension);
  return type.empty() ? std::vector{extension} : std::vector{type, extension};
}

Handler ReadShellHandler(const std::wstring& extension, const ShellHandler& facts) {
  Handler handler{facts.role, CLSID_QelShellExt, {}, {}};
  const std::wstring ownKey = extension + L"\\ShellEx\\" + facts.key;
  for (const wchar_t* const name : {facts.rival, facts.key}) {
    if (name == nullptr) continue;
    for (const std::wstring& parent : ParentsOfHandlers(extension)) {
      const std::wstring key = parent + L"\\ShellEx\\" + name;
      handler.registered = SpelledGuid(TextValue(HKEY_CLASSES_ROOT, key));
      handler.key = L"HKEY_CLASSES_ROOT\\" + key;
      handler.isOwnKey = key == ownKey;
      if (!handler.registered.empty()) return handler;
    }
  }
  return handler;
}

}  // namespace

std::vector<KindOfFile> ReadHandlers() {
  std::vector<KindOfFile> kinds;
  for (const std::wstring_view name : kExtensions) {
    const std::wstring extension = L"." + std::wstring(name);
    KindOfFile kind{extension, {}};
    for (const ShellHandler& facts : kShellHandlers) {
      kind.handlers.push_back(ReadShellHandler(extension, facts));
    }
    if (const CLSID* const store = StoreClassOf(extension)) {
      const std::wstring key = kPropertyHandlers + extension;
      kind.handlers.push_back({L"property store", *store, SpelledGuid(TextValue(HKEY_LOCAL_MACHINE, key)),
                               L"HKEY_LOCAL_MACHINE\\" + key});
    }
    kinds.push_back(std::move(kind));
  }
  return kinds;
}

RegisteredClass ReadClass(const std::wstring& clsid) {
  const std::wstring path = L"CLSID\\" + clsid;
  Com::OwnedKey key;
  if (RegOpenKeyExW(HKEY_CLASSES_ROOT, path.c_str(), 0, KEY_READ, key.Put()) != ERROR_SUCCESS) return {};
  const std::wstring server = path + L"\\InprocServer32";
  return {true,
          TextValue(HKEY_CLASSES_ROOT, path),
          FullPath(TextValue(HKEY_CLASSES_ROOT, server)),
          TextValue(HKEY_CLASSES_ROOT, server, L"ThreadingModel"),
          BlockingKey(clsid),
          IsUnapproved(clsid)};
}

std::wstring InstalledProduct() {
  const std::wstring uninstall = LR"(SOFTWARE\Microsoft\Windows\CurrentVersion\Uninstall)";
  Com::OwnedKey key;
  if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, uninstall.c_str(), 0, KEY_READ, key.Put()) != ERROR_SUCCESS)
    return {};
  wchar_t name[kMaxKeyCharacters + 1];
  for (DWORD i = 0; RegEnumKeyW(key.Get(), i, name, std::size(name)) == ERROR_SUCCESS; ++i) {
    const std::wstring entry = uninstall + L"\\" + name;
    if (TextValue(HKEY_LOCAL_MACHINE, entry, L"DisplayName") == L"QelShellExt" &&
        NumberValue(HKEY_LOCAL_MACHINE, entry, L"WindowsInstaller") != 0) {
      return name;
    }
  }
  return {};
}

std::wstring FileVersion(const std::wstring& path) {
  const DWORD size = GetFileVersionInfoSizeW(path.c_str(), nullptr);
  std::vector<std::byte> block(size);
  void* found = nullptr;
  UINT length = 0;
  if (size == 0 || !GetFileVersionInfoW(path.c_str(), 0, size, block.data()) ||
      !VerQueryValueW(block.data(), L"\\", &found, &length) || length < sizeof(VS_FIXEDFILEINFO)) {
    return {};
  }
  const auto& facts = *static_cast<const VS_FIXEDFILEINFO*>(found);
  return std::to_wstring(HIWORD(facts.dwFileVersionMS)) + L"." +
         std::to_wstring(LOWORD(facts.dwFileVersionMS)) + L"." +
         std::to_wstring(HIWORD(facts.dwFileVersionLS));
}

}  // namespace Qel::Lumetra::ShellExt::Show
