// Single values of the registry.
#pragma once

#include <windows.h>

#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// A text, with environment variables replaced; empty without one. Without `name` it is the default value.
std::wstring TextValue(HKEY root, const std::wstring& key, const wchar_t* name = nullptr);

/// A number; 0 without one.
DWORD NumberValue(HKEY root, const std::wstring& key, const wchar_t* name);

/// Whether there is such a value, of any type.
bool HasValue(HKEY root, const std::wstring& key, const std::wstring& name);

}  // namespace Qel::Lumetra::ShellExt::Show
