// Converts the values that the extension returns, and formats them as text.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <objidl.h>
#include <propidl.h>

#include <string>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Returns for instance "VT_UI4"; for a type that this program does not know, its number.
std::wstring TypeName(VARTYPE type);

/// Returns the value; nothing for VT_EMPTY and for a type that this program does not know.
Value ValueOf(const PROPVARIANT& value);
Value ValueOf(const VARIANT& value);

/// Returns the number in decimal, with an exponent only if that is shorter; the string; or an empty string.
std::wstring ValueText(const Value& value);

}  // namespace Qel::Lumetra::ShellExt::Show
