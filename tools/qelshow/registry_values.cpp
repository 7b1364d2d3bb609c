#include "registry_values.h"

#include <cwchar>

namespace Qel::Lumetra::ShellExt::Show {

std::wstring TextValue(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD bytes = 0;
  if (RegGetValueW(root, key.c_str(), name, RRF_RT_REG_SZ, nullptr, nullptr, &bytes) != ERROR_SUCCESS)
    return {};
  std::wstring text(bytes / sizeof(wchar_t), L'\0');
  if (RegGetValueW(root, key.c_str(), name, RRF_RT_REG_SZ, nullptr, text.data(), &bytes) != ERROR_SUCCESS)
    return {};
  text.resize(std::wcslen(text.c_str()));
  return text;
}

DWORD NumberValue(HKEY root, const std::wstring& key, const wchar_t* name) {
  DWORD number = 0;
  DWORD bytes = sizeof number;
  const LSTATUS status = RegGetValueW(root, key.c_str(), name, RRF_RT_REG_DWORD, nullptr, &number, &bytes);
  return status == ERROR_SUCCESS ? number : 0;
}

bool HasValue(HKEY root, const std::wstring& key, const std::wstring& name) {
  return RegGetValueW(root, key.c_str(), name.c_str(), RRF_RT_ANY, nullptr, nullptr, nullptr) ==
         ERROR_SUCCESS;
}

}  // namespace Qel::Lumetra::ShellExt::Show
