// Reads single values of the registry.
#pragma once

#include <windows.h>

#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// Returns a string value with its environment variables expanded, or an empty string if there is none.
/// Without `name`, returns the default value.
std::wstring TextValue(HKEY root, const std::wstring& key, const wchar_t* name = nullptr);

/// Returns a number, or 0 if there is none.
DWORD NumberValue(HKEY root, const std::wstring& key, const wchar_t* name);

/// Returns whether the value exists, whatever its type.
bool HasValue(HKEY root, const std::wstring& key, const std::wstring& name);

}  // namespace Qel::Lumetra::ShellExt::Show
