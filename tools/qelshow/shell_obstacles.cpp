#include "shell_obstacles.h"

#include <windows.h>

#include <shlwapi.h>

#include "class_ids.h"
#include "registry_values.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

constexpr const wchar_t* kPolicies = LR"(Software\Microsoft\Windows\CurrentVersion\Policies\Explorer)";
constexpr const wchar_t* kFolderOptions = LR"(Software\Microsoft\Windows\CurrentVersion\Explorer\Advanced)";

/// A number in the registry that hides thumbnails unless it is 0 or missing.
struct HidingSetting {
  const wchar_t* name;  // its name in Windows
  const wchar_t* value;
  bool isPolicy;
  bool isForNetworkFolders;
};

constexpr HidingSetting kHidingSettings[] = {
    {L"\"Turn off the display of thumbnails and only display icons\"", L"DisableThumbnails", true, false},
    {L"\"Turn off the display of thumbnails and only display icons on network folders\"",
     L"DisableThumbnailsOnNetworkFolders", true, true},
    {L"\"Always show icons, never thumbnails\"", L"IconsOnly", false, false},
};

std::wstring NameOf(const HidingSetting& setting) {
  return std::wstring(L"the ") + (setting.isPolicy ? L"policy " : L"setting ") + setting.name;
}

/// Returns what to do about the setting, as the end of a sentence.
std::wstring AdviceFor(const HidingSetting& setting) {
  return setting.isPolicy ? L": ask an administrator to disable the policy."
                          : L": clear it in Folder Options, on the View tab.";
}

/// Returns the keys in which the setting is on. A policy can apply to the computer or to the user.
std::vector<std::wstring> KeysThatTurnOn(const HidingSetting& setting) {
  const std::wstring key = setting.isPolicy ? kPolicies : kFolderOptions;
  std::vector<std::wstring> keys;
  if (setting.isPolicy && NumberValue(HKEY_LOCAL_MACHINE, key, setting.value) != 0)
    keys.push_back(L"HKEY_LOCAL_MACHINE\\" + key);
  if (NumberValue(HKEY_CURRENT_USER, key, setting.value) != 0) keys.push_back(L"HKEY_CURRENT_USER\\" + key);
  return keys;
}

/// Returns whether the contents of the file are not on this computer, as in cloud storage.
bool IsPlaceholder(const std::wstring& path) {
  constexpr DWORD kRecallOnDataAccess = 0x400000;
  const DWORD attributes = GetFileAttributesW(path.c_str());
  return attributes != INVALID_FILE_ATTRIBUTES &&
         (attributes & (FILE_ATTRIBUTE_OFFLINE | kRecallOnDataAccess)) != 0;
}

}  // namespace

std::vector<std::wstring> FindSettingsThatHideThumbnails() {
  std::vector<std::wstring> sentences;
  for (const HidingSetting& setting : kHidingSettings) {
    for (const std::wstring& key : KeysThatTurnOn(setting)) {
      sentences.push_back(std::wstring(L"Windows shows no thumbnails ") +
                          (setting.isForNetworkFolders ? L"in network folders " : L"") + L"because of " +
                          NameOf(setting) + L" (" + setting.value + L" in " + key + L")" +
                          AdviceFor(setting));
    }
  }
  return sentences;
}

std::wstring CauseOfNoThumbnail(const std::wstring& path) {
  for (const HidingSetting& setting : kHidingSettings) {
    if (setting.isForNetworkFolders && !PathIsNetworkPathW(path.c_str())) continue;
    if (!KeysThatTurnOn(setting).empty())
      return L"The likely cause is " + NameOf(setting) + AdviceFor(setting);
  }
  if (IsPlaceholder(path)) {
    return L"The likely cause is that the file is in cloud storage and not on this computer: choose \"Always "
           L"keep on this device\" in its menu.";
  }
  if (NumberValue(HKEY_CLASSES_ROOT, L"CLSID\\" + GuidText(CLSID_QelShellExt), L"DisableProcessIsolation") ==
      0) {
    return L"The likely cause is that QelShellExt does not work in the isolated process in which Windows "
           L"runs thumbnail handlers: see \"If Windows shows no thumbnails\" in the user guide.";
  }
  return L"The cause is unknown: sign out and in again, and see \"Why a thumbnail may be missing\" in the "
         L"user guide.";
}

std::wstring CauseOfAnotherThumbnail() {
  return L"The likely cause is an older thumbnail in Windows' cache, which you can empty, or another "
         L"program's thumbnail handler: see \"The cache\" and \"Another program\" in the user guide.";
}

std::wstring CauseOfOtherProperties() {
  return L"The likely cause is that Windows has not noticed the installation yet, or another program's "
         L"property handler: sign out and in again, and see \"Another program\" in the user guide.";
}

}  // namespace Qel::Lumetra::ShellExt::Show
