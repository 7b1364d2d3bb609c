#include "fault_text.h"

#include <gtest/gtest.h>

#include <limits>
#include <sstream>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

/// Returns the text of the fault; "none" for an extension without a parser. Every fault must come with
/// advice.
std::string TextOf(const std::string& bytes, const std::wstring& extension) {
  std::istringstream stream(bytes);
  const auto text = ExplainFault(stream, extension);
  if (!text) return "none";
  EXPECT_EQ(text->fault.empty(), text->advice.empty()) << text->fault;
  return text->fault;
}

SerFile OneImageSeries() {
  return SerFile{.elements = {SerElement{.pixels = "p"}}};
}

TEST(FaultText, IsEmptyForAnIntactFile) {
  EXPECT_EQ(TextOf(MrcFile{.pixels = "p"}.Bytes(), L"mrc"), "");
  EXPECT_EQ(TextOf(MrcFile{.pixels = "p"}.Bytes(), L"Ali"), "");
  EXPECT_EQ(TextOf(OneImageSeries().Bytes(), L"ser"), "");
  EXPECT_EQ(TextOf(EbnFile{.afterHeader = "p"}.Bytes(), L"ebn"), "");
  EXPECT_EQ(TextOf(OneImageEmiFile(0x2202, 1, 1, "p").Bytes(), L"emi"), "");
  EXPECT_EQ(TextOf(RawFile{.pixels = "p"}.Bytes(), L"raw"), "");
}

TEST(FaultText, IsNoneForAnUnknownExtension) {
  EXPECT_EQ(TextOf(MrcFile{.pixels = "p"}.Bytes(), L"mrc2"), "none");
  EXPECT_EQ(TextOf("", L""), "none");
}

TEST(FaultText, NamesTheFirstInvalidField) {
  EXPECT_EQ(TextOf(MrcFile{.nx = 0, .mode = 99}.Bytes(), L"mrc"),
            "The header is invalid: nx is 0, but must be at least 1.");
  EXPECT_EQ(TextOf(EbnFile{.dataOffset = 53}.Bytes(), L"ebn"),
            "The header is invalid: data offset is 53, but must be at least 54, the size of the header.");
}

TEST(FaultText, WritesACodeInHexadecimalLikeItsRule) {
  EXPECT_EQ(TextOf(EmiFile{.magic = 0x4A}.Bytes(), L"emi"),
            "The header is invalid: magic is 0x004A, but must be 0x4B4A.");
}

TEST(FaultText, NamesAFieldThatIsNotANumber) {
  EXPECT_EQ(TextOf(RawFile{.magic = "QEL RawImage!"}.Bytes(), L"raw"),
            "The header is invalid: magic must be the text \"QEL RawImage\" and a zero byte.");
}

TEST(FaultText, SaysThatAHeaderAppearsToBeBigEndian) {
  constexpr std::int32_t kLarge = 0x7FFFFFFF;
  EXPECT_EQ(TextOf(MrcFile{.nx = kLarge, .ny = kLarge}.Bytes(), L"mrc"),
            "The header, which appears to be big-endian, is invalid: nx is -129, but must be at least 1.");
}

TEST(FaultText, NamesAnElementOfAnUnknownType) {
  SerFile file = OneImageSeries();
  file.elements.front().typeCode = 11;
  EXPECT_EQ(TextOf(file.Bytes(), L"ser"),
            "The header is invalid: the data type code of an element is 11, but must be from 1 to 10.");
}

TEST(FaultText, ReportsAFileThatEndsBeforeItsFrame) {
  EXPECT_EQ(TextOf("", L"mrc"), "The file is empty.");
  EXPECT_EQ(TextOf("J", L"emi"), "The file ends within its header or index: it has only 1 byte.");
  EXPECT_EQ(TextOf(EbnFile{.width = 2, .afterHeader = "p"}.Bytes(), L"ebn"),
            "The file is cut short: the frame ends at byte 56, but the file has only 55 bytes.");
}

TEST(FaultText, ReportsAFileWithoutAnImage) {
  EXPECT_EQ(TextOf(EmiFile{}.Bytes(), L"emi"), "The file contains no image object.");
  EXPECT_EQ(TextOf(EmiFile{.items = EmiImageObject("")}.Bytes(), L"emi"),
            "The frame has no pixels: its size is 0 x 0.");
  EXPECT_EQ(TextOf(RawFile{.width = 0, .height = 5}.Bytes(), L"raw"),
            "The frame has no pixels: its size is 0 x 5.");
  SerFile lines = OneImageSeries();
  lines.dataTypeId = 0x4120;
  EXPECT_EQ(TextOf(lines.Bytes(), L"ser"),
            "The file contains a series of lines (data type id 0x4120), not of images.");
}

TEST(FaultText, ReportsAFrameBeyondTheFirst2GiB) {
  const std::string text =
      "The frame is not within the first 2 GiB of the file, so QelShellExt cannot read it.";
  EXPECT_EQ(TextOf(MrcFile{.nx = 50000, .ny = 50000}.Bytes(), L"mrc"), text);
  EXPECT_EQ(TextOf(MrcFile{.nx = 1024, .ny = 1024, .nz = 4096}.Bytes(), L"mrc"), text);
}

TEST(FaultText, ReportsASizeAndStridesThatDoNotMatchTheData) {
  // 10,000 x 10,000 pixels that share a few bytes.
  const std::string shared =
      RawFile{.width = 10000, .height = 10000, .pixelStride = 0, .rowStride = 0, .pixels = "x"}.Bytes();
  EXPECT_EQ(TextOf(shared, L"raw"),
            "The frame size and the strides in the header do not match the 1 byte of image data.");
  // 2^32 + 256 pixels, of which 32 bits keep 256.
  const std::string wrapped = MrcFile{.nx = 0x1000001, .ny = 256, .pixels = std::string(256, 'x')}.Bytes();
  EXPECT_EQ(TextOf(wrapped, L"mrc"),
            "The frame size and the strides in the header do not match the 256 bytes of image data.");
}

std::string AdviceFor(const std::string& bytes, const std::wstring& extension) {
  std::istringstream stream(bytes);
  return ExplainFault(stream, extension)->advice;
}

TEST(FaultText, AdvisesWhatToDo) {
  const std::string incomplete = "Copy it again, or wait until it has been written completely.";
  EXPECT_EQ(AdviceFor("", L"mrc"), incomplete);
  EXPECT_EQ(AdviceFor("J", L"emi"), incomplete);
  EXPECT_EQ(AdviceFor(EbnFile{.width = 2, .afterHeader = "p"}.Bytes(), L"ebn"), incomplete);
  const std::string wrongKind =
      "Check that the file-name extension is right. If it is, copy the file again. If that does not help, "
      "the original is damaged or of an unsupported version.";
  EXPECT_EQ(AdviceFor(MrcFile{.nx = 0}.Bytes(), L"mrc"), wrongKind);
  EXPECT_EQ(AdviceFor(EmiFile{.items = EmiImageObject("")}.Bytes(), L"emi"), wrongKind);
  EXPECT_EQ(AdviceFor(EmiFile{.items = EmiText(1, "a")}.Bytes(), L"emi"),
            "The file is damaged: copy it again.");
  EXPECT_EQ(AdviceFor(EmiFile{}.Bytes(), L"emi"),
            "A file without images, for example with spectra only, has no thumbnail. If it should contain "
            "images, copy it again.");
  EXPECT_EQ(AdviceFor(MrcFile{.nx = 50000, .ny = 50000}.Bytes(), L"mrc"),
            "If the file is a stack, split it into files of less than 2 GiB.");
}

TEST(FaultText, ReportsContentsThatCannotBeParsed) {
  EXPECT_EQ(TextOf(EmiFile{.items = EmiText(1, "a")}.Bytes(), L"emi"),
            "The file cannot be read beyond byte 12: bad EMI object index.");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
