#include "shell_obstacles.h"

#include <windows.h>

#include <shlwapi.h>

#include "class_ids.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

constexpr const wchar_t* kPolicies = LR"(Software\Microsoft\Windows\CurrentVersion\Policies\Explorer)";
constexpr const wchar_t* kFolderOptions = LR"(Software\Microsoft\Windows\CurrentVersion\Explorer\Advanced)";

/// Whether a number in the registry is there and not zero.
bool IsSet(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD number = 0;
  DWORD size = sizeof number;
  return RegGetValueW(root, key.c_str(), name, RRF_RT_REG_DWORD, nullptr, &number, &size) == ERROR_SUCCESS &&
         number != 0;
}

/// Whether the policy is set, for the user or for the computer.
bool IsPolicy(const wchar_t* name) {
  return IsSet(HKEY_CURRENT_USER, kPolicies, name) || IsSet(HKEY_LOCAL_MACHINE, kPolicies, name);
}

/// Whether the contents of the file are somewhere else, as with cloud storage.
bool IsPlaceholder(const std::wstring& path) {
  constexpr DWORD kRecallOnDataAccess = 0x400000;
  const DWORD attributes = GetFileAttributesW(path.c_str());
  return attributes != INVALID_FILE_ATTRIBUTES &&
         (attributes & (FILE_ATTRIBUTE_OFFLINE | kRecallOnDataAccess)) != 0;
}

}  // namespace

std::wstring CauseOfNoThumbnail(const std::wstring& path) {
  if (IsPolicy(L"DisableThumbnails")) {
    return L"the policy \"Turn off the display of thumbnails and only display icons\"";
  }
  if (PathIsNetworkPathW(path.c_str()) && IsPolicy(L"DisableThumbnailsOnNetworkFolders")) {
    return L"the policy \"Turn off the display of thumbnails and only display icons on network folders\"";
  }
  if (IsSet(HKEY_CURRENT_USER, kFolderOptions, L"IconsOnly")) {
    return L"the setting \"Always show icons, never thumbnails\" in Folder Options";
  }
  if (IsPlaceholder(path)) return L"that the file is a placeholder of cloud storage, not on this computer";
  if (!IsSet(HKEY_CLASSES_ROOT, L"CLSID\\" + GuidText(CLSID_QelShellExt), L"DisableProcessIsolation")) {
    return L"the isolated process in which Windows runs thumbnail handlers: see \"Before you deploy\" in the "
           L"user "
           L"guide about the feature inprocess";
  }
  return L"not known: log on again, and see \"Why a thumbnail may be missing\" in the user guide";
}

std::wstring CauseOfAnotherThumbnail() {
  return L"Windows' thumbnail cache, which may hold an older picture, or the handler of another program";
}

std::wstring CauseOfOtherProperties() {
  return L"the property handler of another program, or that Windows has not noticed the registration: log on "
         L"again";
}

}  // namespace Qel::Lumetra::ShellExt::Show
