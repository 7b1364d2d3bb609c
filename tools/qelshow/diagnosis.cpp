#include "diagnosis.h"

#include <windows.h>

#include <exception>
#include <fstream>

#include "file_type_factory.h"
#include "path_stream.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {

Diagnosis Diagnose(const std::wstring& path) {
  const DWORD attributes = GetFileAttributesW(path.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES) {
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(GetLastError()) + L"."};
  }
  if ((attributes & FILE_ATTRIBUTE_DIRECTORY) != 0) return {Verdict::kFailed, L"This is a folder."};

  const std::wstring extension = GetExtension(path);
  std::ifstream stream;
  OpenPath(stream, path.c_str());
  if (!stream.is_open()) {
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(GetLastError()) + L"."};
  }
  try {
    const auto reader = CreateFileTypeInfo(stream, extension);
    if (reader == nullptr) {
      return {Verdict::kUnsupported,
              L"The extension shows .mrc, .ali, .rec, .ser, .emi, .ebn and .raw files only."};
    }
    if (!reader->IsValid()) return {Verdict::kDamaged, L"The header is not acceptable."};
  } catch (const std::exception& e) {
    return {Verdict::kDamaged, L"The contents cannot be followed: " + Wide(e.what()) + L"."};
  }
  return {};
}

}  // namespace Qel::Lumetra::ShellExt::Show
