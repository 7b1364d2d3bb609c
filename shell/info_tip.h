// The text that the shell shows when the pointer rests on a file.
#pragma once

#include <windows.h>

#include <string>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Makes the tip of the valid file that `reader` reads and that was opened at `path`: a line each for the
/// dimensions and the type, then for the date of the last change and the size if the file is still there,
/// then the comment if it has one. `tip` is the caller's, to be freed with the shell's task allocator, and
/// written on success only. Fails when there is no allocator or no memory (E_OUTOFMEMORY).
HRESULT MakeInfoTip(const FileTypeInfo& reader, const std::wstring& path, wchar_t** tip);

}  // namespace Qel::Lumetra::ShellExt
