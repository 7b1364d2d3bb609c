// Values as the extension delivers them, put into words.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <objidl.h>
#include <propidl.h>

#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// For instance "VT_UI4"; the number of a type that this program does not know.
std::wstring TypeName(VARTYPE type);

/// The value in plain decimal or as its text; empty for VT_EMPTY and for a type without a text.
std::wstring ValueText(const PROPVARIANT& value);
std::wstring ValueText(const VARIANT& value);

}  // namespace Qel::Lumetra::ShellExt::Show
