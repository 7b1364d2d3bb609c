// Writes a page of files: index.html and one PNG file for every thumbnail, in one folder.
//
// The page is the template page.html, a resource of the program, with the files' JSON reports in it; its
// script makes everything that is seen of them. Files are written one by one as they come, so that the memory
// taken does not depend on their number.
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

/// The files of a page in this folder.
std::wstring PagePath(const std::wstring& folder);
std::wstring PicturePath(const std::wstring& folder, std::size_t number);

/// Whether a file that begins with these bytes is a page of this program; kMarkedPageBytes are enough.
bool IsMarkedPage(std::string_view beginning);
inline constexpr std::size_t kMarkedPageBytes = 1024;

class PageWriter {
 public:
  /// Makes the folder if it is missing. `shownFolder` is what the page is about. Throws Failure for whatever
  /// cannot be written, here and below.
  PageWriter(const std::wstring& folder, const std::wstring& shownFolder);
  ~PageWriter();
  PageWriter(const PageWriter&) = delete;
  PageWriter& operator=(const PageWriter&) = delete;

  void Add(const FileFacts& facts);

  /// Puts the page with its pictures into the folder, in the place of an earlier one. Without this nothing in
  /// the folder changes.
  void Finish();

  /// Where the page is, with all its folders.
  std::wstring path() const { return AbsolutePath(PagePath(folder_)); }

 private:
  void Write(std::string_view text);

  std::wstring folder_;
  std::wstring unfinished_;  // a folder for the new page until it is complete
  Com::OwnedHandle file_;
  std::string_view templateEnd_;  // what follows the files
  std::size_t count_ = 0;
  std::set<std::wstring> pictures_;  // file names
};

}  // namespace Qel::Lumetra::ShellExt::Show
