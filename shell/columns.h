// The columns that the shell's Details view offers for image files.
#pragma once

#include <windows.h>

#include <shlobj.h>

namespace Qel::Lumetra::ShellExt {

/// Describes the column `index`, counted from 0. Returns S_FALSE, without writing `info`, after the last
/// column, and E_POINTER for a null `info`.
HRESULT DescribeColumn(DWORD index, SHCOLUMNINFO* info);

/// Reads the value of a column for one file and stores it in place of the previous contents of `value`. The
/// file is opened for this call, by the path in `item` alone. Offline files are opened too.
///
/// Returns S_FALSE, without writing `value`, for a key without a property, for a file that cannot be opened
/// or is not valid, and for an unsupported file-name extension. Returns E_POINTER for a null `item` if the
/// column belongs to one of the two property sets, and for a null `value` if there is a value to store.
/// Returns the failure of VariantClear if `value` cannot be cleared, and E_OUTOFMEMORY if there is no memory
/// for a string. After a failure `value` keeps its previous contents.
HRESULT ReadColumn(const SHCOLUMNID& column, const SHCOLUMNDATA* item, VARIANT* value);

}  // namespace Qel::Lumetra::ShellExt
