#include "file_inspection.h"

#include <windows.h>

#include <algorithm>
#include <cwchar>
#include <iterator>
#include <utility>

#include "file_type_factory.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// Fills the size and the date of the file, if it exists.
void FillSizeAndDate(const std::wstring& path, FileFacts& facts) {
  WIN32_FILE_ATTRIBUTE_DATA data{};
  SYSTEMTIME time{};
  if (!GetFileAttributesExW(path.c_str(), GetFileExInfoStandard, &data)) return;
  facts.bytes = (std::uint64_t{data.nFileSizeHigh} << 32) | data.nFileSizeLow;
  if (!FileTimeToSystemTime(&data.ftLastWriteTime, &time)) return;
  wchar_t text[32];
  const int length = std::swprintf(text, std::size(text), L"%04d-%02d-%02dT%02d:%02d:%02dZ", time.wYear,
                                   time.wMonth, time.wDay, time.wHour, time.wMinute, time.wSecond);
  facts.modified = std::wstring(text, text + length);
}

std::wstring Square(std::int32_t size) {
  return std::to_wstring(size) + L" x " + std::to_wstring(size);
}

/// Fills `answer`. If the process crashes instead, the answer's problem says so.
template <class Answer>
void Fill(Worker& worker, Subject subject, const std::wstring& path, const wchar_t* what, Answer& answer) {
  if (const auto end = worker.Ask({subject, path}, answer)) {
    answer.problem =
        std::wstring(L"The extension crashed when asked for ") + what + L": " + ProcessEndText(*end) + L".";
  }
}

/// Returns the value of a property, or 0 if it is missing.
std::int32_t Number(const ListAnswer<Property>& properties, std::uint32_t id) {
  const auto property = std::ranges::find(properties.items, id, &Property::id);
  const auto* const number =
      property == properties.items.end() ? nullptr : std::get_if<std::int64_t>(&property->value);
  return number == nullptr ? 0 : static_cast<std::int32_t>(*number);
}

/// Returns the pixel type, which only the tip contains, at the end of its first line: "Dimensions: (640 ×
/// 480) 8 bit unsigned".
std::wstring PixelType(const std::wstring& tip) {
  const std::wstring line = tip.substr(0, tip.find(L"\r\n"));
  const std::size_t end = line.find(L") ");
  return end == std::wstring::npos ? std::wstring() : line.substr(end + 2);
}

constexpr const wchar_t* kReport =
    L"Please report this to the developers of QelShellExt, with the file if possible.";

/// Returns whether the request crashes the process because the frame is in colour and smaller than the
/// request.
bool IsSmallColourFrame(const FileFacts& facts, std::int32_t size) {
  return facts.type.starts_with(L"24 bit") && facts.width < size && facts.height < size;
}

/// Returns whether the reduction to `size` pixels leaves no row or no column of the frame.
bool IsTooNarrow(const FileFacts& facts, std::int32_t size) {
  const auto [shorter, longer] = std::minmax(facts.width, facts.height);
  return shorter < longer / size;
}

void FillThumbnail(Worker& worker, const std::wstring& path, std::int32_t size, FileFacts& facts) {
  ThumbnailAnswer answer;
  const auto end = worker.Ask({Subject::kThumbnail, path, size}, answer);
  facts.thumbnail = std::move(answer.thumbnail);
  facts.thumbnail.request = size;
  facts.png = std::move(answer.png);
  if (!end) {
    if (facts.png.empty() && IsTooNarrow(facts, size)) {
      facts.thumbnail.problem =
          L"The frame has " + std::to_wstring(facts.width) + L" x " + std::to_wstring(facts.height) +
          L" pixels, which is too narrow for a thumbnail of " + Square(size) + L" pixels.";
      facts.advice = L"Use larger icons, or qelshow thumbnail with a larger --size.";
    }
    return;
  }
  if (IsSmallColourFrame(facts, size)) {
    facts.thumbnail.problem = L"The frame is in colour and smaller than the requested thumbnail (" +
                              Square(size) + L" pixels), and the extension crashes on such a request: " +
                              ProcessEndText(*end) + L".";
    facts.advice = L"View it with smaller icons.";
  } else {
    facts.thumbnail.problem = L"The extension crashed when asked for a thumbnail of " + Square(size) +
                              L" pixels: " + ProcessEndText(*end) + L".";
  }
}

}  // namespace

FileFacts InspectFile(Worker& worker, const std::wstring& path, const std::wstring& name, std::int32_t size) {
  FileFacts facts;
  // The shell passes full paths.
  const std::wstring absolute = AbsolutePath(path);
  facts.path = absolute;
  facts.named = path;
  facts.name = name;
  facts.kind = Lowered(GetExtension(path));
  facts.thumbnail.request = size;
  FillSizeAndDate(absolute, facts);

  Diagnosis diagnosis;
  if (const auto end = worker.Ask({Subject::kDiagnosis, absolute}, diagnosis)) {
    diagnosis = {Verdict::kNoThumbnail,
                 L"qelshow's worker process crashed while it read the file: " + ProcessEndText(*end) + L".",
                 kReport};
  }
  facts.verdict = diagnosis.verdict;
  facts.problem = diagnosis.problem;
  facts.advice = diagnosis.advice;
  facts.header = std::move(diagnosis.header);
  if (diagnosis.verdict == Verdict::kFailed || diagnosis.verdict == Verdict::kUnsupported) {
    facts.thumbnail.problem = facts.tip.problem = facts.columns.problem = facts.propertySets.problem =
        facts.propertyStore.problem = diagnosis.problem;
    return facts;
  }
  Fill(worker, Subject::kTip, absolute, L"the tip", facts.tip);
  Fill(worker, Subject::kColumns, absolute, L"the columns", facts.columns);
  Fill(worker, Subject::kPropertySets, absolute, L"the property sets", facts.propertySets);
  Fill(worker, Subject::kPropertyStore, absolute, L"the property store", facts.propertyStore);
  facts.width = Number(facts.propertySets, 3);
  facts.height = Number(facts.propertySets, 4);
  facts.bitDepth = Number(facts.propertySets, 7);
  facts.frames = Number(facts.propertySets, 12);
  facts.type = PixelType(facts.tip.text);
  FillThumbnail(worker, absolute, size, facts);

  // A file for which the extension has a thumbnail is good, whatever this program's readers find.
  if (!facts.png.empty()) {
    facts.verdict = Verdict::kGood;
    facts.problem.clear();
    facts.advice.clear();
  } else if (facts.verdict == Verdict::kGood) {
    facts.verdict = Verdict::kNoThumbnail;
    facts.problem = facts.thumbnail.problem;
    if (facts.advice.empty()) facts.advice = kReport;
  }
  if (absolute.size() >= MAX_PATH) {
    facts.remark = L"The path has " + std::to_wstring(absolute.size()) +
                   L" characters, and programs that use the older columns interface of Windows get no "
                   L"columns for paths of 260 characters or more: move the file or shorten a name.";
  }
  return facts;
}

}  // namespace Qel::Lumetra::ShellExt::Show
