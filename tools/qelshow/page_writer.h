// Writes a page that shows files: index.html and a PNG file for each thumbnail, in one folder.
//
// The page consists of the template page.html, a resource of the program, and the facts about the files as
// JSON, which the page's script displays. Each file is written as soon as it is added, so that the memory in
// use does not depend on their number.
#pragma once

#include <windows.h>

#include <cstddef>
#include <set>
#include <string>
#include <string_view>

#include "file_facts.h"
#include "handle_owner.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Return the paths of a page's files in this folder.
std::wstring PagePath(const std::wstring& folder);
std::wstring ThumbnailPath(const std::wstring& folder, std::size_t number);

/// Returns whether a file that begins with these bytes is a page of this program. kMarkedPageBytes bytes are
/// enough.
bool IsMarkedPage(std::string_view beginning);
inline constexpr std::size_t kMarkedPageBytes = 1024;

class PageWriter {
 public:
  /// Creates the folder if it does not exist. `shownFolder` is the folder that the page shows. Like the
  /// functions below, it throws Failure if something cannot be written.
  PageWriter(const std::wstring& folder, const std::wstring& shownFolder);
  ~PageWriter();
  PageWriter(const PageWriter&) = delete;
  PageWriter& operator=(const PageWriter&) = delete;

  void Add(const FileFacts& facts);

  /// Moves the page with its thumbnails into the folder, where it replaces an earlier one. Without this call
  /// nothing in the folder changes.
  void Finish();

  /// Returns the absolute path of the page.
  std::wstring path() const { return AbsolutePath(PagePath(folder_)); }

 private:
  void Write(std::string_view text);

  std::wstring folder_;
  std::wstring unfinished_;  // the folder of the new page until it is complete
  Com::OwnedHandle file_;
  std::string_view templateEnd_;  // the part of the template after the JSON
  std::size_t count_ = 0;
  std::set<std::wstring> thumbnails_;  // file names
};

}  // namespace Qel::Lumetra::ShellExt::Show
