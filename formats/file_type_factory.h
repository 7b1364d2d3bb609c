// The choice of reader by file name extension. The contents play no part in it: a file with a known
// extension always gets that kind's reader, which may then find the file not valid.
#pragma once

#include <istream>
#include <memory>
#include <string>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// The text after the last dot of the whole path, folders included; empty without one. For a name without
/// a dot inside of a folder with one that is the tail of the path, which is no known extension.
std::wstring GetExtension(const std::wstring& path);

/// Whole extensions, compared without regard to case.
bool IsSerExtension(const std::wstring& extension);
bool IsMrcExtension(const std::wstring& extension);
bool IsEbnExtension(const std::wstring& extension);
bool IsEmiExtension(const std::wstring& extension);
bool IsRawExtension(const std::wstring& extension);

/// The reader of the kind that `extension` names, or none for an unknown one. It has parsed the header when
/// this returns, and reads from `stream` as long as it lives. What a reader's constructor throws passes
/// through.
std::unique_ptr<FileTypeInfo> CreateFileTypeInfo(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
