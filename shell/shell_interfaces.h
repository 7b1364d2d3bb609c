// The shell's interfaces that this layer implements, with the identifiers that mingw-w64's headers do not
// attach to them.
#pragma once

#include <windows.h>

#include <propsys.h>
#include <shlobj.h>

#include "com_root.h"

namespace Qel::Com {

template <>
inline constexpr IID kInterfaceId<IQueryInfo> = {
    0x00021500, 0x0000, 0x0000, {0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x46}};
template <>
inline constexpr IID kInterfaceId<IColumnProvider> = {
    0xE8025004, 0x1C42, 0x11D2, {0xBE, 0x2C, 0x00, 0xA0, 0xC9, 0xA8, 0x3D, 0xA1}};

}  // namespace Qel::Com
