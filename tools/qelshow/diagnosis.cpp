#include "diagnosis.h"

#include <windows.h>

#include <fstream>

#include "fault_text.h"
#include "file_list.h"
#include "file_type_factory.h"
#include "path_stream.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {

Diagnosis Diagnose(const std::wstring& path) {
  const DWORD attributes = GetFileAttributesW(path.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES) {
    const DWORD error = GetLastError();
    if (IsUnmatchedPattern(path)) return {Verdict::kFailed, L"No file matches."};
    if (error == ERROR_INVALID_NAME) {
      return {Verdict::kFailed, L"The file cannot be opened: Windows cannot represent its name."};
    }
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(error) + L"."};
  }
  if ((attributes & FILE_ATTRIBUTE_DIRECTORY) != 0)
    return {Verdict::kFailed, L"This is a folder; \"qelshow page\" shows the files in it."};

  std::ifstream stream;
  OpenPath(stream, path.c_str());
  if (!stream.is_open()) {
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(GetLastError()) + L"."};
  }
  const auto fault = FaultText(stream, GetExtension(path));
  if (!fault) {
    return {Verdict::kUnsupported, L"The extension shows " + SupportedExtensions(L"and") + L" files only."};
  }
  if (!fault->empty()) return {Verdict::kDamaged, Wide(*fault)};
  return {};
}

}  // namespace Qel::Lumetra::ShellExt::Show
