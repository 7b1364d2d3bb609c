#include "file_list.h"

#include <windows.h>

#include <shlwapi.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <system_error>
#include <utility>

#include "failure.h"
#include "file_facts.h"
#include "file_kinds.h"
#include "file_type_factory.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

namespace fs = std::filesystem;

void AddFolder(const fs::path& folder, std::vector<ListedFile>& files) {
  const std::size_t first = files.size();
  std::error_code error;
  // A folder named on the command line must be readable. An unreadable subfolder is skipped.
  const fs::directory_iterator named(folder, error);
  fs::recursive_directory_iterator entry;
  if (!error) entry = {folder, fs::directory_options::skip_permission_denied, error};
  for (; !error && entry != fs::recursive_directory_iterator(); entry.increment(error)) {
    if (!IsSupported(entry->path().wstring())) continue;
    // An entry whose name Windows does not allow cannot be examined. It is listed, so that it is reported.
    std::error_code unknown;
    if (!entry->is_regular_file(unknown) && !unknown) continue;
    files.push_back({entry->path().wstring(), {}});
  }
  if (error) {
    throw Failure(L"The folder \"" + folder.wstring() + L"\" cannot be listed: " + SystemErrorText(error) +
                  L".");
  }
  std::sort(files.begin() + static_cast<std::ptrdiff_t>(first), files.end(),
            [](const ListedFile& a, const ListedFile& b) {
              const int order = StrCmpLogicalW(a.path.c_str(), b.path.c_str());
              return order != 0 ? order < 0 : a.path < b.path;
            });
}

/// Returns the common beginning of both folders, up to and including a backslash. Ignores case.
std::wstring SharedFolder(const std::wstring& a, const std::wstring& b) {
  std::size_t length = 0;
  for (std::size_t i = 0; i < std::min(a.size(), b.size()); ++i) {
    if (CompareStringOrdinal(&a[i], 1, &b[i], 1, TRUE) != CSTR_EQUAL) break;
    if (a[i] == L'\\') length = i + 1;
  }
  return a.substr(0, length);
}

/// Returns the absolute path of the deepest folder that contains all of these files and folders, with a
/// backslash at its end; an empty string if there is none.
std::wstring FolderOfAll(const std::vector<std::wstring>& paths) {
  std::optional<std::wstring> shared;
  for (const std::wstring& path : paths) {
    std::error_code ignored;
    std::wstring folder = AbsolutePath(path);
    if (!fs::is_directory(path, ignored)) folder.resize(folder.rfind(L'\\') + 1);
    if (!folder.ends_with(L'\\')) folder += L'\\';
    shared = shared ? SharedFolder(*shared, folder) : folder;
  }
  return shared.value_or(L"");
}

/// Throws the Failure for paths that lead to no file that can be shown.
[[noreturn]] void NothingToShow(const std::vector<std::wstring>& paths) {
  const auto isMissing = [](const std::wstring& path) {
    return GetFileAttributesW(path.c_str()) == INVALID_FILE_ATTRIBUTES;
  };
  if (const auto missing = std::ranges::find_if(paths, isMissing); missing != paths.end()) {
    const std::wstring reason = SystemErrorText(GetLastError());
    if (IsUnmatchedPattern(*missing)) throw Failure(L"No file matches \"" + *missing + L"\".");
    throw Failure(L"\"" + *missing + L"\" cannot be opened: " + reason + L".");
  }
  const std::wstring& first = paths.front();
  std::error_code ignored;
  const bool isFolder = fs::is_directory(first, ignored);
  throw Failure(L"\"" + first +
                    (isFolder ? L"\" contains no supported files (" : L"\" is not a supported file (") +
                    SupportedExtensions(L"or") + L").",
                static_cast<int>(Verdict::kUnsupported));
}

}  // namespace

bool IsSupported(const std::wstring& path) {
  return WithKindOf(GetExtension(fs::path(path).filename().wstring()), [](const auto&) {});
}

std::wstring SupportedExtensions(std::wstring_view conjunction) {
  std::wstring text;
  for (std::size_t i = 0; i < kExtensions.size(); ++i) {
    if (i > 0) text += i + 1 < kExtensions.size() ? L", " : L" " + std::wstring(conjunction) + L" ";
    text += L"." + std::wstring(kExtensions[i]);
  }
  return text;
}

bool IsUnmatchedPattern(const std::wstring& path) {
  if (path.find_first_of(L"*?") == std::wstring::npos) return false;
  WIN32_FIND_DATAW found{};
  const HANDLE search = FindFirstFileW(path.c_str(), &found);
  if (search == INVALID_HANDLE_VALUE) return true;
  FindClose(search);
  return false;
}

FileList ListFiles(const std::vector<std::wstring>& paths) {
  std::vector<ListedFile> files;
  for (const std::wstring& path : paths) {
    std::error_code error;
    if (fs::is_directory(path, error)) {
      AddFolder(path, files);
    } else {
      files.push_back({path, {}});
    }
  }
  const auto canBeShown = [](const ListedFile& file) {
    std::error_code ignored;
    return IsSupported(file.path) && fs::exists(file.path, ignored);
  };
  if (std::ranges::none_of(files, canBeShown)) NothingToShow(paths);
  std::wstring folder = FolderOfAll(paths);
  for (ListedFile& file : files) file.name = AbsolutePath(file.path).substr(folder.size());
  if (folder.size() > 3) folder.pop_back();  // C:\ keeps its backslash, because C: is another folder
  return {std::move(folder), std::move(files)};
}

}  // namespace Qel::Lumetra::ShellExt::Show
