#include "header_facts.h"

#include <gtest/gtest.h>

#include <sstream>

#include "ebn_file.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {

/// For the messages of failed tests.
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

/// Expects no facts of a file that is cut to any length below `headerBytes`.
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
