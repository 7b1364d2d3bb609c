// The columns that the shell's Details view offers for image files.
#pragma once

#include <windows.h>

#include <shlobj.h>

namespace Qel::Lumetra::ShellExt {

/// Describes the column `index`, counted from 0. S_FALSE, with nothing written, after the last one.
HRESULT DescribeColumn(DWORD index, SHCOLUMNINFO* info);

/// The value of a column for one file, in the place of what `value` held. The file is opened for this call
/// only and by its path only; offline files are opened too.
///
/// S_FALSE, with nothing written, for a property that no column has, a file that cannot be opened or is not
/// valid, and one whose extension names no kind of image. E_POINTER for a null `item` where the file has to
/// be looked at, and for a null `value` where there is an answer; the failure of VariantClear for a `value`
/// that cannot be cleared; E_OUTOFMEMORY. After a failure `value` holds what it held.
HRESULT ReadColumn(const SHCOLUMNID& column, const SHCOLUMNDATA* item, VARIANT* value);

}  // namespace Qel::Lumetra::ShellExt
