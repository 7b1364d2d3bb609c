// The files that a page shows.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

struct ListedFile {
  std::wstring path;
  std::wstring name;  // what the page calls it: relative to the folder of the list
};

struct FileList {
  std::wstring
      folder;  // full path of the deepest folder that holds all files; empty if they are on several drives
  std::vector<ListedFile> files;
};

/// Whether the extension shows files with this one's extension.
bool IsSupported(const std::wstring& path);

/// Whether the path has wildcards and no file matches them.
bool IsUnmatchedPattern(const std::wstring& path);

/// The files named, and of the folders named all files of the supported kinds, also in folders below them,
/// in natural order of their names (9 before 10). A path that does not exist is kept as a file, so that it is
/// reported. Throws Failure for a folder that cannot be listed, and if nothing is there that can be shown.
FileList ListFiles(const std::vector<std::wstring>& paths);

/// The extensions of the supported kinds in a sentence, for instance ".mrc, .ser and .raw".
std::wstring SupportedExtensions(std::wstring_view conjunction);

}  // namespace Qel::Lumetra::ShellExt::Show
