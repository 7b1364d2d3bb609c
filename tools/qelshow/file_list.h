// Lists the files that a page shows.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

struct ListedFile {
  std::wstring path;
  std::wstring name;  // on the page: the path relative to the folder of the list
};

struct FileList {
  /// The absolute path of the deepest folder that contains all files; empty if they are on different drives.
  std::wstring folder;

  std::vector<ListedFile> files;
};

/// Returns whether the extension supports the file-name extension of `path`.
bool IsSupported(const std::wstring& path);

/// Returns whether the path has wildcards that no file matches.
bool IsUnmatchedPattern(const std::wstring& path);

/// Returns the files among `paths`, and all files of the supported kinds in the folders among them and their
/// subfolders, in the natural order of their names (9 before 10). A path that does not exist is returned as a
/// file, so that it is reported. Throws Failure if a folder cannot be listed, or if there is nothing to show.
FileList ListFiles(const std::vector<std::wstring>& paths);

/// Returns the file-name extensions of the supported kinds for a sentence, for instance ".mrc, .ser and
/// .raw".
std::wstring SupportedExtensions(std::wstring_view conjunction);

}  // namespace Qel::Lumetra::ShellExt::Show
