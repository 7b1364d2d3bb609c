// Writes a page of files: index.html and one PNG file for every thumbnail, in one folder.
//
// The page is the template page.html, a resource of the program, with the files' JSON reports in it; its
// script makes everything that is seen of them. Files are written one by one as they come, so that the memory
// taken does not depend on their number.
#pragma once

#include <windows.h>

#include <string>
#include <string_view>

#include "file_facts.h"
#include "handle_owner.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {

class PageWriter {
 public:
  /// Makes the folder if it is missing. Throws Failure for whatever cannot be written, here and below.
  explicit PageWriter(const std::wstring& folder);

  void Add(const FileFacts& facts);

  /// Without this, no page appears in the folder, and one of an earlier run stays.
  void Finish();

  /// Where the page is, with all its folders.
  std::wstring path() const { return AbsolutePath(path_); }

 private:
  void Write(std::string_view text);

  std::wstring folder_;
  std::wstring path_;
  std::wstring unfinishedPath_;
  Com::OwnedHandle file_;
  std::string_view templateEnd_;  // what follows the files
  std::size_t count_ = 0;
};

/// Writes a file in one go.
void WriteFileAt(const std::wstring& path, const void* bytes, std::size_t size);

}  // namespace Qel::Lumetra::ShellExt::Show
