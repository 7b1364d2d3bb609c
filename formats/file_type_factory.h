// Chooses the reader by file-name extension. The contents do not matter: a file with a known extension always
// gets that kind's reader, which may then find that the file is not valid.
#pragma once

#include <istream>
#include <memory>
#include <string>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Returns the part after the last dot of the whole path, folders included; empty without a dot. If only a
/// folder has a dot, the result is the rest of the path, which is not a known extension.
std::wstring GetExtension(const std::wstring& path);

/// Return whether `extension` is one of the kind's extensions, without regard to case.
bool IsSerExtension(const std::wstring& extension);
bool IsMrcExtension(const std::wstring& extension);
bool IsEbnExtension(const std::wstring& extension);
bool IsEmiExtension(const std::wstring& extension);
bool IsRawExtension(const std::wstring& extension);

/// Creates the reader of the kind that `extension` names; null for an unknown one. The reader has parsed the
/// header and uses `stream` for its whole lifetime. Exceptions of its constructor are not caught.
std::unique_ptr<FileTypeInfo> CreateFileTypeInfo(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
