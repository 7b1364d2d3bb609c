#include "fault_text.h"

#include <cstdint>
#include <exception>
#include <iomanip>
#include <sstream>
#include <string_view>

#include "file_kinds.h"
#include "frame_reader.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Formats a number in hexadecimal if `rule` contains hexadecimal numbers: then it is a code, not a quantity.
std::string NumberText(std::int64_t value, std::string_view rule) {
  if (rule.find("0x") == std::string_view::npos) return std::to_string(value);
  std::ostringstream text;
  text << "0x" << std::hex << std::uppercase << std::setfill('0') << std::setw(4) << value;
  return text.str();
}

constexpr const char* kIncomplete = "Copy it again, or wait until it has been written completely.";
constexpr const char* kWrongKind =
    "Check that the file-name extension is right. If it is, copy the file again. If that does not help, the "
    "original is damaged or of an unsupported version.";
constexpr const char* kNoImage =
    "A file without images, for example with spectra only, has no thumbnail. If it should contain images, "
    "copy it again.";
constexpr const char* kTooLarge = "If the file is a stack, split it into files of less than 2 GiB.";

FaultText HeaderText(const Fault& fault, bool isSwapped) {
  if (fault.field == nullptr) return {fault.rule, kNoImage};
  std::string text =
      isSwapped ? "The header, which appears to be big-endian, is invalid: " : "The header is invalid: ";
  text += fault.field;
  if (fault.value) text += " is " + NumberText(*fault.value, fault.rule) + ", but";
  return {text + " must be " + fault.rule + ".", kWrongKind};
}

std::string Bytes(std::int64_t count) {
  return std::to_string(count) + (count == 1 ? " byte" : " bytes");
}

/// Returns what is wrong if the file, which has `end` bytes, does not contain the frame.
FaultText FrameText(const FrameLayout& frame, std::int64_t end) {
  if (frame.size.width < 1 || frame.size.height < 1) {
    return {"The frame has no pixels: its size is " + std::to_string(frame.size.width) + " x " +
                std::to_string(frame.size.height) + ".",
            kWrongKind};
  }
  if (frame.blockPosition < 0 || frame.blockBytes < 0) {
    return {"The frame is not within the first 2 GiB of the file, so QelShellExt cannot read it.", kTooLarge};
  }
  const std::int64_t frameEnd = frame.blockPosition + frame.blockBytes;
  if (frameEnd > end) {
    return {"The file is cut short: the frame ends at byte " + std::to_string(frameEnd) +
                ", but the file has only " + Bytes(end) + ".",
            kIncomplete};
  }
  if (!IsReadable(frame)) {
    return {"The frame size and the strides in the header do not match the " + Bytes(frame.blockBytes) +
                " of image data.",
            kWrongKind};
  }
  return {};
}

template <Parser KindParser>
FaultText TextOf(const KindParser& parser, std::int64_t end) {
  if (end == 0) return {"The file is empty.", kIncomplete};
  if (parser.stream().eof()) {
    return {"The file ends within its header or index: it has only " + Bytes(end) + ".", kIncomplete};
  }
  if (parser.fault()) return HeaderText(*parser.fault(), parser.isSwapped());
  return FrameText(parser.frame(), end);
}

}  // namespace

std::optional<FaultText> ExplainFault(std::istream& stream, const std::wstring& extension) {
  stream.seekg(0, std::ios_base::end);
  const std::int64_t end = stream.tellg();
  stream.seekg(0);
  std::optional<FaultText> text;
  WithKindOf(extension, [&]<class KindParser>(const FileKind<KindParser>&) {
    try {
      text = TextOf(KindParser(stream), end);
    } catch (const std::exception& e) {
      stream.clear();
      text = {"The file cannot be read beyond byte " + std::to_string(stream.tellg()) + ": " + e.what() + ".",
              "The file is damaged: copy it again."};
    }
  });
  return text;
}

}  // namespace Qel::Lumetra::ShellExt
