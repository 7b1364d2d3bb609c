#include "diagnosis.h"

#include <windows.h>

#include <cstdint>
#include <exception>
#include <fstream>
#include <iomanip>
#include <optional>
#include <sstream>
#include <string_view>

#include "ebn_file_info.h"
#include "emi_file_info.h"
#include "file_type_factory.h"
#include "header_check.h"
#include "mrc_file_info.h"
#include "path_stream.h"
#include "raw_file_info.h"
#include "ser_file_info.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// A sentence about a damaged file; empty for a good one.
using Finding = std::wstring;

/// Written as the rule writes numbers: a rule with hexadecimal numbers is about a code, not a quantity.
std::wstring NumberText(std::int64_t value, std::string_view rule) {
  if (rule.find("0x") == std::string_view::npos) return std::to_wstring(value);
  std::wostringstream text;
  text << L"0x" << std::hex << std::uppercase << std::setfill(L'0') << std::setw(4) << value;
  return text.str();
}

Finding FaultText(const HeaderFault& fault, bool isSwapped) {
  Finding text =
      isSwapped ? L"The header, read as big-endian, is not acceptable: " : L"The header is not acceptable: ";
  if (fault.value) {
    text += Wide(fault.field) + L" is " + NumberText(*fault.value, fault.rule) + L" and must be ";
  } else {
    text += Wide(fault.field) + L" must be ";
  }
  return text + Wide(fault.rule) + L".";
}

std::wstring Bytes(std::int64_t count) {
  return std::to_wstring(count) + (count == 1 ? L" byte" : L" bytes");
}

/// The part that all kinds have in common, as far as parsing the header: `end` is the size of the file. A
/// header that is read as big-endian is `isSwapped`.
Finding ExplainHeader(const std::istream& stream, const std::optional<HeaderFault>& fault, std::int64_t end,
                      bool isSwapped = false) {
  if (stream.eof()) {
    return L"The file ends before its header and index do: it has only " + Bytes(end) + L".";
  }
  if (fault) return FaultText(*fault, isSwapped);
  return {};
}

/// Whether the file holds the picture at all.
Finding ExplainFrame(const FrameLayout& frame, std::int64_t end) {
  if (frame.size.width < 1 || frame.size.height < 1) {
    return L"The picture has no pixels: it is " + std::to_wstring(frame.size.width) + L" x " +
           std::to_wstring(frame.size.height) + L".";
  }
  if (frame.blockPosition < 0 || frame.blockBytes < 0) {
    return L"The picture lies beyond the first 2 GiB of the file, where this format is not read.";
  }
  if (frame.blockPosition + frame.blockBytes > end) {
    return L"The file is cut short: the picture takes the bytes up to " +
           std::to_wstring(frame.blockPosition + frame.blockBytes) + L", and the file has " + Bytes(end) +
           L".";
  }
  return {};
}

Finding ExplainMrc(std::istream& stream, std::int64_t end) {
  const MrcHeader header(stream);
  const Finding finding = ExplainHeader(stream, header.fault(), end, header.isSwapped());
  return finding.empty() ? ExplainFrame(header.Section(header.sections() / 2), end) : finding;
}

Finding ExplainRaw(std::istream& stream, std::int64_t end) {
  const RawHeader header(stream);
  const Finding finding = ExplainHeader(stream, header.fault(), end);
  return finding.empty() ? ExplainFrame(header.Frame(), end) : finding;
}

Finding ExplainEbn(std::istream& stream, std::int64_t end) {
  const EbnParser parser(stream);
  const Finding finding = ExplainHeader(stream, parser.fault(), end);
  return finding.empty() ? ExplainFrame(parser.Frame(), end) : finding;
}

Finding ExplainSer(std::istream& stream, std::int64_t end) {
  const SerParser parser(stream);
  Finding finding = ExplainHeader(stream, parser.fault(), end);
  if (!finding.empty()) return finding;
  if (!parser.isImageSeries())
    return L"This is a series of lines (data type id 0x4120), which have no picture.";
  return ExplainFrame(parser.FirstFrame(), end);
}

Finding ExplainEmi(std::istream& stream, std::int64_t end) {
  const EmiParser parser(stream);
  Finding finding = ExplainHeader(stream, parser.fault(), end);
  if (!finding.empty()) return finding;
  if (parser.imageCount() == 0) return L"The file holds no image object.";
  return ExplainFrame(parser.FirstFrame(), end);
}

/// Answers nothing for an unknown extension.
std::optional<Finding> Explain(std::istream& stream, const std::wstring& extension, std::int64_t end) {
  if (IsSerExtension(extension)) return ExplainSer(stream, end);
  if (IsMrcExtension(extension)) return ExplainMrc(stream, end);
  if (IsEbnExtension(extension)) return ExplainEbn(stream, end);
  if (IsEmiExtension(extension)) return ExplainEmi(stream, end);
  if (IsRawExtension(extension)) return ExplainRaw(stream, end);
  return std::nullopt;
}

}  // namespace

Diagnosis Diagnose(const std::wstring& path) {
  const DWORD attributes = GetFileAttributesW(path.c_str());
  if (attributes == INVALID_FILE_ATTRIBUTES) {
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(GetLastError()) + L"."};
  }
  if ((attributes & FILE_ATTRIBUTE_DIRECTORY) != 0)
    return {Verdict::kFailed, L"This is a folder; \"qelshow page\" shows the files in it."};

  std::ifstream stream;
  OpenPath(stream, path.c_str());
  if (!stream.is_open()) {
    return {Verdict::kFailed, L"The file cannot be opened: " + SystemErrorText(GetLastError()) + L"."};
  }
  stream.seekg(0, std::ios_base::end);
  const std::int64_t end = stream.tellg();
  stream.seekg(0);
  try {
    const auto finding = Explain(stream, GetExtension(path), end);
    if (!finding) {
      return {Verdict::kUnsupported,
              L"The extension shows .mrc, .ali, .rec, .ser, .emi, .ebn and .raw files only."};
    }
    if (!finding->empty()) return {Verdict::kDamaged, *finding};
  } catch (const std::exception& e) {
    stream.clear();
    return {Verdict::kDamaged, L"The contents cannot be followed beyond byte " +
                                   std::to_wstring(stream.tellg()) + L": " + Wide(e.what()) + L"."};
  }
  return {};
}

}  // namespace Qel::Lumetra::ShellExt::Show
