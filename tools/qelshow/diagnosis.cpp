#include "diagnosis.h"

#include <windows.h>

#include <cmath>
#include <fstream>
#include <string>
#include <utility>
#include <variant>

#include "fault_text.h"
#include "file_list.h"
#include "file_type_factory.h"
#include "header_facts.h"
#include "path_stream.h"
#include "text_tools.h"
#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// Returns the number, or a string if JSON cannot represent it.
Value RecordValue(double number) {
  if (std::isfinite(number)) return number;
  return ValueText(number);
}

Value RecordValue(std::int64_t number) {
  return number;
}

Value RecordValue(const std::string& text) {
  return TextOfFile(text);
}

HeaderFact RecordOf(const ShellExt::HeaderFact& fact) {
  return {Wide(fact.name), std::visit([](const auto& value) { return RecordValue(value); }, fact.value),
          TextOfFile(fact.unit)};
}

Diagnosis CannotOpen(const std::wstring& path, DWORD error) {
  if (IsUnmatchedPattern(path))
    return {Verdict::kFailed, L"No file matches.", L"Check the pattern and the folder."};
  const std::wstring problem = L"The file cannot be opened: ";
  switch (error) {
    case ERROR_INVALID_NAME:
      return {Verdict::kFailed, problem + L"its name contains characters that Windows does not allow.",
              L"Check the name, or rename the file on the system that created it."};
    case ERROR_FILE_NOT_FOUND:
    case ERROR_PATH_NOT_FOUND:
      return {Verdict::kFailed, problem + SystemErrorText(error) + L".", L"Check its name and folder."};
    default:
      return {Verdict::kFailed, problem + SystemErrorText(error) + L".",
              L"Check that you have permission to read it and that no other program has locked it."};
  }
}

}  // namespace

Diagnosis Diagnose(const std::wstring& path) {
  const DWORD attributes = GetFileAttributesW(path.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES) return CannotOpen(path, GetLastError());
  if ((attributes & FILE_ATTRIBUTE_DIRECTORY) != 0)
    return {Verdict::kFailed, L"This is a folder.", L"Use \"qelshow page\" to see the files in it."};

  std::ifstream stream;
  OpenPath(stream, path.c_str());
  if (!stream.is_open()) return CannotOpen(path, GetLastError());
  const auto text = ExplainFault(stream, GetExtension(path));
  if (!text) {
    return {Verdict::kUnsupported, L"QelShellExt supports only " + SupportedExtensions(L"and") + L" files.",
            L"If the file is one of these, give it the right file-name extension."};
  }
  Diagnosis diagnosis;
  if (!text->fault.empty()) diagnosis = {Verdict::kNoThumbnail, Wide(text->fault), Wide(text->advice)};
  for (const ShellExt::HeaderFact& fact : HeaderFacts(stream, GetExtension(path))) {
    diagnosis.header.push_back(RecordOf(fact));
  }
  return diagnosis;
}

}  // namespace Qel::Lumetra::ShellExt::Show
