// Values as the extension delivers them.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <objidl.h>
#include <propidl.h>

#include <string>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// For instance "VT_UI4"; the number of a type that this program does not know.
std::wstring TypeName(VARTYPE type);

/// Returns nothing for VT_EMPTY and for a type that this program does not know.
Value ValueOf(const PROPVARIANT& value);
Value ValueOf(const VARIANT& value);

/// The number in decimal, with an exponent only if that is shorter, the text, or an empty text.
std::wstring ValueText(const Value& value);

}  // namespace Qel::Lumetra::ShellExt::Show
