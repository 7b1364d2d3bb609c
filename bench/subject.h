// What is measured: the ways in which the shell uses an image file. Natively these are the readers, on
// Windows the objects of the built DLL.
#pragma once

#include <windows.h>

#include <string>

namespace Qel::Lumetra::ShellExt::Bench {

/// The whole way from the file to its bitmap, which is the caller's; null when there is none.
HBITMAP MakeThumbnail(const std::wstring& path, const SIZE& request);

/// Makes a reader of the file, which parses its header or index, and drops it. Returns whether it is valid.
bool OpenFile(const std::wstring& path);

/// Asks what the shell shows of a file beside its picture: "reader" (natively), or "tip", "columns", "sets"
/// or "store" (on Windows). Returns whether there were answers.
bool ReadMetadata(const std::string& what, const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Bench
