// The info tip, which the shell shows when the pointer rests on a file.
#pragma once

#include <windows.h>

#include <string>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Makes the tip of the valid file that `reader` reads and that was opened at `path`: one line each for the
/// dimensions and the type; for the date of the last change and the size if the file still exists; and the
/// comment if it has one. The caller frees `tip` with the shell's task allocator. Returns E_OUTOFMEMORY if
/// there is no memory, or the failure to get the allocator; `tip` is written on success only.
HRESULT MakeInfoTip(const FileTypeInfo& reader, const std::wstring& path, wchar_t** tip);

}  // namespace Qel::Lumetra::ShellExt
