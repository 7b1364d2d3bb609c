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

/// Returns the number, or its text if JSON cannot represent it.
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

Diagnosis Unreachable(const std::wstring& path, DWORD error) {
  if (IsUnmatchedPattern(path))
    return {Verdict::kFailed, L"No file matches.", L"Check the pattern and its folder."};
  const std::wstring problem = L"The file cannot be opened: ";
  switch (error) {
    case ERROR_INVALID_NAME:
      return {Verdict::kFailed, problem + L"Windows cannot represent its name.", L"Rename it."};
    case ERROR_FILE_NOT_FOUND:
    case ERROR_PATH_NOT_FOUND:
      return {Verdict::kFailed, problem + SystemErrorText(error) + L".", L"Check its name and its folder."};
    default:
      return {Verdict::kFailed, problem + SystemErrorText(error) + L".",
              L"Check that you have permission to read it and that no other program has locked it."};
  }
}

}  // namespace

Diagnosis Diagnose(const std::wstring& path) {
  const DWORD attributes = GetFileAttributesW(path.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES) return Unreachable(path, GetLastError());
  if ((attributes & FILE_ATTRIBUTE_DIRECTORY) != 0)
    return {Verdict::kFailed, L"This is a folder.", L"Use \"qelshow page\" for the files in it."};

  std::ifstream stream;
  OpenPath(stream, path.c_str());
  if (!stream.is_open()) return Unreachable(path, GetLastError());
  const auto text = ExplainFault(stream, GetExtension(path));
  if (!text) {
    return {Verdict::kUnsupported, L"The extension shows " + SupportedExtensions(L"and") + L" files only.",
            L"If the file is of one of these kinds, give it that extension."};
  }
  Diagnosis diagnosis;
  if (!text->fault.empty()) diagnosis = {Verdict::kDamaged, Wide(text->fault), Wide(text->advice)};
  for (const ShellExt::HeaderFact& fact : HeaderFacts(stream, GetExtension(path))) {
    diagnosis.header.push_back(RecordOf(fact));
  }
  return diagnosis;
}

}  // namespace Qel::Lumetra::ShellExt::Show
