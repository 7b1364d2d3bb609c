#include "file_list.h"

#include <algorithm>
#include <filesystem>

#include "failure.h"
#include "file_type_factory.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

namespace fs = std::filesystem;

bool IsSupported(const fs::path& path) {
  const std::wstring extension = GetExtension(path.filename().wstring());
  return IsMrcExtension(extension) || IsSerExtension(extension) || IsEmiExtension(extension) ||
         IsEbnExtension(extension) || IsRawExtension(extension);
}

void AddFolder(const fs::path& folder, std::vector<ListedFile>& files) {
  const std::size_t first = files.size();
  std::error_code error;
  // The folder that was named has to open; one below it that does not is passed over.
  fs::directory_iterator named(folder, error);
  fs::recursive_directory_iterator entry;
  if (!error) entry = {folder, fs::directory_options::skip_permission_denied, error};
  for (; !error && entry != fs::recursive_directory_iterator(); entry.increment(error)) {
    std::error_code ignored;
    if (!IsSupported(entry->path()) || !entry->is_regular_file(ignored)) continue;
    files.push_back({entry->path().wstring(), entry->path().lexically_relative(folder).wstring()});
  }
  if (error) {
    throw Failure(L"The folder \"" + folder.wstring() + L"\" cannot be listed: " + SystemErrorText(error) +
                  L".");
  }
  std::sort(files.begin() + static_cast<std::ptrdiff_t>(first), files.end(),
            [](const ListedFile& a, const ListedFile& b) { return a.name < b.name; });
}

}  // namespace

std::vector<ListedFile> ListFiles(const std::vector<std::wstring>& paths) {
  std::vector<ListedFile> files;
  for (const std::wstring& path : paths) {
    std::error_code error;
    if (fs::is_directory(path, error)) {
      AddFolder(path, files);
    } else {
      files.push_back({path, fs::path(path).filename().wstring()});
    }
  }
  return files;
}

}  // namespace Qel::Lumetra::ShellExt::Show
