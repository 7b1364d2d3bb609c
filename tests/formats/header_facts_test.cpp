#include "header_facts.h"

#include <gtest/gtest.h>

#include <sstream>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {

/// Prints a fact in the message of a failed test.
void PrintTo(const HeaderFact& fact, std::ostream* stream) {
  *stream << fact.name << " = ";
  std::visit([stream](const auto& value) { *stream << value; }, fact.value);
  *stream << " " << fact.unit;
}

namespace {

using namespace Testing;

using Facts = std::vector<HeaderFact>;

Facts FactsOf(const std::string& bytes, const std::wstring& extension) {
  std::istringstream stream(bytes);
  return HeaderFacts(stream, extension);
}

/// Expects no facts of a file that is truncated to any length below `headerBytes`.
void ExpectNoneOfAShorterHeader(const std::string& bytes, std::size_t headerBytes,
                                const std::wstring& extension) {
  for (std::size_t length = 0; length < headerBytes; ++length) {
    EXPECT_EQ(FactsOf(bytes.substr(0, length), extension), Facts{}) << length;
  }
  EXPECT_NE(FactsOf(bytes.substr(0, headerBytes), extension), Facts{});
}

TEST(HeaderFacts, OfARawBlockAreItsStrides) {
  RawFile file;
  file.offset = 1234567;
  file.pixelStride = -8;
  file.rowStride = -2048;
  EXPECT_EQ(FactsOf(file.Bytes(), L"raw"), (Facts{{"Offset of the first pixel", 1234567, "B"},
                                                  {"Pixel stride", -8, "B"},
                                                  {"Row stride", -2048, "B"}}));
  ExpectNoneOfAShorterHeader(file.Bytes(), 49, L"raw");
  file.word1 = 2;
  EXPECT_EQ(FactsOf(file.Bytes(), L"raw"), Facts{});
}

TEST(HeaderFacts, OfAnEbnFileAreTheNumbersOfItsInstrument) {
  EbnFile file;
  file.model = 2;
  file.source = -1.6;
  file.lens = 0.25;
  file.dNumber = 3415;
  file.kilovolts = 299.75;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ebn"), (Facts{{"Microscope model code", 2.0},
                                                  {"Electron source code", -1.6},
                                                  {"Objective lens code", 0.25},
                                                  {"D number", 3415.0},
                                                  {"Accelerating voltage", 299.75, "kV"}}));
  ExpectNoneOfAShorterHeader(file.Bytes(), 54, L"ebn");
  file.width = 0;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ebn"), Facts{});
}

/// Returns a series of two images. Only the first one gives facts.
SerFile Series() {
  SerFile file;
  file.tagTypeId = 0x4142;
  file.dimensions = {{.size = 3,
                      .calibration = {.offset = -1.5, .delta = 0.25, .element = 2},
                      .description = "Defocus",
                      .units = "um"},
                     {.size = 0xFFFFFFFF,
                      .calibration = {.offset = 1e300, .delta = 1.2e-9, .element = -7},
                      .description = "",
                      .units = ""}};
  file.elements.resize(2);
  file.elements[0].calibrationX = {.offset = -3e-9, .delta = 1.5e-9, .element = 4};
  file.elements[0].calibrationY = {.offset = 5e-9, .delta = 2.5e-9, .element = -6};
  file.elements[0].pixels = file.elements[1].pixels = "p";
  return file;
}

const Facts kSeriesFacts = {{"Tags", "positions"},
                            {"Number of dimensions", 2},
                            {"Dimension 1 size", 3},
                            {"Dimension 1 calibration offset", -1.5, "um"},
                            {"Dimension 1 calibration delta", 0.25, "um"},
                            {"Dimension 1 calibration element", 2},
                            {"Dimension 1 description", "Defocus"},
                            {"Dimension 1 units", "um"},
                            {"Dimension 2 size", 0xFFFFFFFF},
                            {"Dimension 2 calibration offset", 1e300},
                            {"Dimension 2 calibration delta", 1.2e-9},
                            {"Dimension 2 calibration element", -7}};
const Facts kElementFacts = {{"X calibration offset", -3e-9}, {"X calibration delta", 1.5e-9},
                             {"X calibration element", 4},    {"Y calibration offset", 5e-9},
                             {"Y calibration delta", 2.5e-9}, {"Y calibration element", -6}};

Facts Joined(Facts first, const Facts& second) {
  first.insert(first.end(), second.begin(), second.end());
  return first;
}

TEST(HeaderFacts, OfASeriesAreItsTagsItsDimensionsAndTheCalibrationsOfItsFirstImage) {
  SerFile file = Series();
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Joined(kSeriesFacts, kElementFacts));
  file.version = 0x0220;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Joined(kSeriesFacts, kElementFacts));
  // A series of lines has no thumbnail, but its header gives facts.
  file.dataTypeId = 0x4120;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Joined(kSeriesFacts, kElementFacts));
  file.tagTypeId = 0x4152;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser").front(), (HeaderFact{"Tags", "times"}));
}

TEST(HeaderFacts, OfADamagedSeriesAreThoseBeforeTheFault) {
  SerFile file = Series();
  file.elements[1].typeCode = 11;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Joined(kSeriesFacts, kElementFacts));
  file.elements[0].typeCode = 11;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), kSeriesFacts);
  file.validElements = 0;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Facts{});

  // A dimension gives facts once its last byte exists, and so does the header of the image.
  file = Series();
  const std::string bytes = file.Bytes();
  const std::size_t first = 30 + 24 + 4 + 7 + 4 + 2;
  const auto truncated = [&bytes](std::size_t length) { return FactsOf(bytes.substr(0, length), L"ser"); };
  EXPECT_EQ(truncated(29), Facts{});
  EXPECT_EQ(truncated(30), Facts(kSeriesFacts.begin(), kSeriesFacts.begin() + 2));
  EXPECT_EQ(truncated(first - 1), Facts(kSeriesFacts.begin(), kSeriesFacts.begin() + 2));
  EXPECT_EQ(truncated(first), Facts(kSeriesFacts.begin(), kSeriesFacts.begin() + 8));
  EXPECT_EQ(truncated(first + 31), Facts(kSeriesFacts.begin(), kSeriesFacts.begin() + 8));
  EXPECT_EQ(truncated(first + 32), kSeriesFacts);

  file.dimensions.clear();
  file.offsetArrayOffset = 30;
  file.elements.clear();
  file.validElements = file.totalElements = 1;
  file.offsetArrays = BytesOf<std::uint32_t>({30 + 8, 0}) + Series().elements[0].Bytes();
  const std::string element = file.Bytes();
  EXPECT_EQ(FactsOf(element.substr(0, element.size() - 2), L"ser").size(), 2u);
  EXPECT_EQ(FactsOf(element.substr(0, element.size() - 1), L"ser").size(), 8u);
}

TEST(HeaderFacts, OfASeriesAreAtMost16DimensionsAnd512BytesOfAString) {
  SerFile file = Series();
  file.dimensions.assign(1000, file.dimensions[0]);
  file.dimensions[15].description = std::string(512, 'd') + std::string(1, 'e');
  file.dimensions[15].units = std::string(512, 'u') + std::string(600, 'v');
  const Facts facts = FactsOf(file.Bytes(), L"ser");
  ASSERT_EQ(facts.size(), 2 + 16 * 6 + kElementFacts.size());
  EXPECT_EQ(facts[1], (HeaderFact{"Number of dimensions", 1000}));
  EXPECT_EQ(facts[2 + 15 * 6 + 4], (HeaderFact{"Dimension 16 description", std::string(512, 'd')}));
  EXPECT_EQ(facts[2 + 15 * 6 + 5], (HeaderFact{"Dimension 16 units", std::string(512, 'u')}));
  EXPECT_EQ(Facts(facts.end() - 6, facts.end()), kElementFacts);
}

TEST(HeaderFacts, OfASeriesThatCannotBeParsedAreNone) {
  SerFile file = Series();
  file.dimensions[0].unitsLength = -1;
  EXPECT_EQ(FactsOf(file.Bytes(), L"ser"), Facts{});
}

/// Returns the extra values of an image or a line. The two use different items for them.
std::string EmiExtraValues(std::uint16_t type, std::uint16_t tag1, double value1, std::uint16_t tag2,
                           double value2) {
  return EmiStructure(type, 0x0300, EmiDouble(tag1, value1) + EmiDouble(tag2, value2));
}

std::string EmiImage() {
  return EmiImageObject(EmiText(0x0100, "one") + EmiText(0x0419, "two") + EmiText(0x0400, "three") +
                        EmiText(0x0440, "four") + EmiText(0x0441, "five") +
                        EmiExtraValues(0x4102, 0x0120, 1.5, 0x0130, -2.5));
}

const Facts kImageFacts = {{"Image label 100", "one"},   {"Image label 419", "two"},
                           {"Image label 400", "three"}, {"Image label 440", "four"},
                           {"Image extra value 1", 1.5}, {"Image extra value 2", -2.5}};

std::string EmiLine(std::uint16_t arrayType = 0x2112) {
  return EmiLineDataObject(
      EmiText(0x0440, "FOUR") + EmiText(0x0400, "THREE") + EmiText(0x0419, "TWO") + EmiText(0x0100, "ONE") +
      EmiArray(arrayType, 0x0202, BytesOf<std::uint32_t>({4'000'000'000}) + std::string(32, 'x')) +
      EmiExtraValues(0x4100, 0x0100, 3.5, 0x0120, -4.5));
}

const Facts kLineFacts = {{"Line label 100", "ONE"},
                          {"Line label 419", "TWO"},
                          {"Line label 400", "THREE"},
                          {"Line label 440", "FOUR"},
                          {"Line length", 4'000'000'000, "values"},
                          {"Line type", "128 bit complex float"},
                          {"Line extra value 1", 3.5},
                          {"Line extra value 2", -4.5}};

Facts FactsOfItems(const std::string& items) {
  return FactsOf(EmiFile{.items = items}.Bytes(), L"emi");
}

Facts FactsOfLines(std::int64_t count, const Facts& facts = kLineFacts) {
  return Joined({{"Number of lines", count}}, facts);
}

TEST(HeaderFacts, OfAnEmiFileAreTheLabelsAndValuesOfItsFirstImageAndItsFirstLine) {
  const std::string second = EmiText(0x0100, "second") + EmiText(0x0400, "second");
  const std::string image2 = EmiImageObject(second + EmiExtraValues(0x4102, 0x0120, 9, 0x0130, 9));
  const std::string line2 = EmiLineDataObject(second + EmiExtraValues(0x4100, 0x0100, 9, 0x0120, 9));
  EXPECT_EQ(FactsOfItems(EmiImage()), kImageFacts);
  EXPECT_EQ(FactsOfItems(EmiImage() + image2), kImageFacts);
  EXPECT_EQ(FactsOfItems(EmiLine()), FactsOfLines(1));
  EXPECT_EQ(FactsOfItems(EmiLine() + image2.substr(0, 4) + EmiEnd() + EmiLine(0x2100) + line2),
            FactsOfLines(3));
  EXPECT_EQ(FactsOfItems(EmiStructure(0x4000, 1, EmiLine() + EmiImage() + line2) + EmiEnd()),
            Joined(kImageFacts, FactsOfLines(2)));
}

TEST(HeaderFacts, OfAnEmiFileAreOnlyThoseThatItHas) {
  EXPECT_EQ(FactsOfItems(EmiImageObject("")), Facts{});
  EXPECT_EQ(FactsOfItems(EmiLineDataObject("")), FactsOfLines(1, {}));
  EXPECT_EQ(FactsOfItems(EmiImageObject(EmiText(0x0419, "") + EmiText(0x0440, "four"))),
            (Facts{{"Image label 440", "four"}}));
  EXPECT_EQ(FactsOfItems(EmiImageObject(EmiStructure(0x4102, 0x0300, EmiDouble(0x0130, 0)))),
            (Facts{{"Image extra value 2", 0.0}}));
}

TEST(HeaderFacts, OfAnEmiFileLieDirectlyInTheirObjects) {
  const std::string labels = EmiText(0x0100, "one");
  // These are one level too deep, in the object of the other kind, or in another structure.
  EXPECT_EQ(FactsOfItems(EmiImageObject(EmiStructure(0x4000, 1, labels))), Facts{});
  EXPECT_EQ(FactsOfItems(EmiImageObject(
                EmiExtraValues(0x4100, 0x0100, 1, 0x0120, 2) + EmiExtraValues(0x4102, 0x0100, 1, 0x0131, 2) +
                EmiStructure(0x4102, 0x0301, EmiDouble(0x0120, 3)) +
                EmiStructure(0x4000, 1, EmiExtraValues(0x4102, 0x0120, 4, 0x0130, 5)))),
            Facts{});
  EXPECT_EQ(
      FactsOfItems(EmiLineDataObject(
          EmiExtraValues(0x4102, 0x0120, 1, 0x0130, 2) + EmiExtraValues(0x4100, 0x0130, 1, 0x0101, 2) +
          EmiArray(0x2112, 0x0203, std::string(8, 'x')) + EmiArray(0x2202, 0x0202, std::string(8, 'x')) +
          EmiArray(0x2110, 0x0202, std::string(8, 'x')))),
      FactsOfLines(1, {}));
  EXPECT_EQ(FactsOfItems(EmiImageObject(EmiArray(0x2112, 0x0202, std::string(8, 'x')))), Facts{});
}

TEST(HeaderFacts, OfAnEmiFileHaveAtMost512BytesOfAString) {
  const std::string image =
      EmiImageObject(EmiText(0x0100, std::string(512, 'a') + "b") + EmiText(0x0419, "two"));
  EXPECT_EQ(FactsOfItems(image),
            (Facts{{"Image label 100", std::string(512, 'a')}, {"Image label 419", "two"}}));
}

TEST(HeaderFacts, OfATruncatedEmiFileAreTheCompleteOnes) {
  const std::string bytes = EmiFile{.items = EmiImage()}.Bytes();
  std::size_t most = 0;
  for (std::size_t length = 0; length <= bytes.size(); ++length) {
    const Facts facts = FactsOf(bytes.substr(0, length), L"emi");
    ASSERT_LE(facts.size(), kImageFacts.size());
    EXPECT_EQ(facts,
              Facts(kImageFacts.begin(), kImageFacts.begin() + static_cast<std::ptrdiff_t>(facts.size())))
        << length;
    EXPECT_GE(facts.size(), most) << length;
    most = facts.size();
  }
  EXPECT_EQ(most, kImageFacts.size());
  const auto text = static_cast<std::uint32_t>(bytes.size());
  EXPECT_EQ(FactsOfItems(EmiImageObject(EmiText(0x0100, "one", text))), Facts{});
}

TEST(HeaderFacts, OfAnEmiFileThatCannotBeParsedAreNone) {
  EXPECT_EQ(FactsOfItems(EmiImage() + EmiText(0x0100, "outside")), Facts{});
}

TEST(HeaderFacts, OfAnMrcFileAreNone) {
  EXPECT_EQ(FactsOf(MrcFile().Bytes(), L"mrc"), Facts{});
}

TEST(HeaderFacts, AreReadFromTheStartOfTheStream) {
  std::istringstream stream(RawFile().Bytes());
  stream.seekg(0, std::ios_base::end);
  stream.get();
  EXPECT_EQ(HeaderFacts(stream, L"RAW").size(), 3u);
}

TEST(HeaderFacts, OfAnUnknownExtensionAreNone) {
  EXPECT_EQ(FactsOf(RawFile().Bytes(), L"tif"), Facts{});
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
