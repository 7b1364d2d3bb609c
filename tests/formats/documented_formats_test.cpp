// Compares the tables of docs/formats.md with the readers, and with the writers of the tests. The current
// folder is docs.
#include <gtest/gtest.h>

#include <bit>
#include <exception>
#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "byte_order.h"
#include "data_type.h"
#include "ebn_file.h"
#include "emi_file.h"
#include "header_facts.h"
#include "image_file_info.h"
#include "mrc_file.h"
#include "open_file.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

using Row = std::vector<std::string>;
using Table = std::vector<Row>;
using Facts = std::vector<HeaderFact>;

std::string Trimmed(const std::string& text) {
  const std::size_t first = text.find_first_not_of(" `");
  return first == std::string::npos ? "" : text.substr(first, text.find_last_not_of(" `") - first + 1);
}

Row Cells(const std::string& line) {
  Row cells;
  std::istringstream stream(line.substr(1));
  for (std::string cell; std::getline(stream, cell, '|');) cells.push_back(Trimmed(cell));
  return cells;
}

/// Returns the rows of the table whose first column is called `column`, in the section `section`. An empty
/// `section` means the part before all sections.
Table Documented(const std::string& section, const std::string& column) {
  std::ifstream file("formats.md");
  EXPECT_TRUE(file.is_open());
  Table table;
  bool inSection = section.empty();
  bool inTable = false;
  for (std::string line; std::getline(file, line);) {
    if (line.ends_with('\r')) line.pop_back();
    if (line.starts_with("## ")) inSection = line.substr(3) == section;
    if (!line.starts_with("|")) inTable = false;
    if (inTable && !line.starts_with("|-")) table.push_back(Cells(line));
    if (inSection && line.starts_with("| " + column + " |")) inTable = true;
  }
  EXPECT_FALSE(table.empty()) << section << ": " << column;
  return table;
}

int Number(const std::string& text) {
  return std::stoi(text, nullptr, 0);
}

std::vector<std::string> Split(std::string text, const std::string& separator) {
  std::vector<std::string> parts;
  for (std::size_t end; (end = text.find(separator)) != std::string::npos;) {
    parts.push_back(text.substr(0, end));
    text.erase(0, end + separator.size());
  }
  parts.push_back(text);
  return parts;
}

std::wstring Wide(const std::string& text) {
  return {text.begin(), text.end()};
}

/// Returns the value of a field as a string, so that numbers of all types can be compared.
std::string ValueAt(const std::string& bytes, const Row& row) {
  const auto* const field = reinterpret_cast<const unsigned char*>(bytes.data()) + Number(row[0]);
  const std::string& type = row[1];
  if (type == "int16") return std::to_string(LoadLittleEndian<std::int16_t>(field));
  if (type == "uint16") return std::to_string(LoadLittleEndian<std::uint16_t>(field));
  if (type == "int32") return std::to_string(LoadLittleEndian<std::int32_t>(field));
  if (type == "uint32") return std::to_string(LoadLittleEndian<std::uint32_t>(field));
  if (type == "uint64") return std::to_string(LoadLittleEndian<std::uint64_t>(field));
  if (type == "double") return std::to_string(LoadLittleEndian<double>(field));
  if (type.starts_with("text"))
    return {bytes.data() + Number(row[0]), static_cast<std::size_t>(Number(type.substr(4)))};
  return "unknown type " + type;
}

using Fields = std::map<std::string, std::string>;

template <class T>
std::string Value(T value) {
  return std::to_string(value);
}

/// Expects every documented field at its documented offset. `fields` lists all of them.
void ExpectFields(const Table& table, const std::string& bytes, const Fields& fields) {
  EXPECT_EQ(table.size(), fields.size());
  for (const Row& row : table) {
    const auto field = fields.find(row[2]);
    ASSERT_NE(field, fields.end()) << row[2];
    EXPECT_EQ(ValueAt(bytes, row), field->second) << row[2];
  }
}

/// The numbers next to the limits of a documented rule: those that it accepts and those that it rejects.
struct Samples {
  std::vector<int> accepted;
  std::vector<int> rejected;
};

/// Returns the samples of a rule. Rules are "7", "7 or 9", "7 to 9", "at least 7" and "at most 7".
Samples SamplesOf(const std::string& rule) {
  if (rule.starts_with("at least ")) {
    const int least = Number(rule.substr(9));
    return {{least}, {least - 1}};
  }
  if (rule.starts_with("at most ")) {
    const int most = Number(rule.substr(8));
    return {{most, most - 1}, {most + 1}};
  }
  if (const auto ends = Split(rule, " to "); ends.size() == 2) {
    return {{Number(ends[0]), Number(ends[1])}, {Number(ends[0]) - 1, Number(ends[1]) + 1}};
  }
  Samples samples;
  for (const std::string& value : Split(rule, " or ")) {
    samples.accepted.push_back(Number(value));
    samples.rejected.push_back(Number(value) - 1);
    samples.rejected.push_back(Number(value) + 1);
  }
  return samples;
}

/// Gives bytes the interface of a file writer, for OpenFile.
struct PlainFile {
  std::string bytes;

  std::string Bytes() const { return bytes; }
};

/// Returns the file with `value` in an integer field.
PlainFile WithField(std::string bytes, const Row& field, int value) {
  const std::string& type = field[1];
  const std::size_t size =
      static_cast<std::size_t>(std::stoi(type.substr(type.find_first_of("0123456789")))) / 8;
  for (std::size_t i = 0; i < size; ++i) {
    bytes.at(static_cast<std::size_t>(Number(field[0])) + i) = static_cast<char>(value >> (8 * i));
  }
  return {bytes};
}

/// Expects that the reader accepts the documented values of each field in an otherwise valid file, and no
/// other values. `count` is the expected number of fields with a rule.
template <class Reader, class File, class... Arguments>
void ExpectRules(const Table& table, std::size_t count, const File& good, const Arguments&... arguments) {
  std::size_t rules = 0;
  for (const Row& row : table) {
    if (row[3].empty()) continue;
    ++rules;
    const Samples samples = SamplesOf(row[3]);
    for (const int value : samples.accepted) {
      const PlainFile file = WithField(good.Bytes(), row, value);
      EXPECT_TRUE(OpenFile<Reader>(file, arguments...)->IsValid()) << row[2] << " " << value;
    }
    for (const int value : samples.rejected) {
      const PlainFile file = WithField(good.Bytes(), row, value);
      EXPECT_FALSE(OpenFile<Reader>(file, arguments...)->IsValid()) << row[2] << " " << value;
    }
  }
  EXPECT_EQ(rules, count);
}

/// Expects that the reader reports the bits and the name of the documented type.
template <class Reader>
void ExpectType(const OpenFile<Reader>& file, const std::string& bits, const std::string& name) {
  EXPECT_TRUE(file->IsValid()) << name;
  EXPECT_EQ(file->GetBitDepth(), Number(bits)) << name;
  EXPECT_EQ(file->GetDataTypeName(), Wide(name));
}

TEST(DocumentedNames, HaveTheirBits) {
  std::map<std::wstring, int> bits = {{L"32 bit complex integer", 32}};  // in MRC files only
  for (std::uint32_t value = 0; value < 32; ++value) {
    const auto type = static_cast<DataType>(value);
    if (BitsPerPixel(type) > 0) bits[DataTypeName(type)] = BitsPerPixel(type);
  }
  std::map<std::wstring, int> documented;
  for (const Row& row : Documented("", "Name")) {
    for (const std::string& name : Split(row[0], ", ")) documented[Wide(name)] = Number(row[1]);
  }
  EXPECT_EQ(documented, bits);
}

TEST(DocumentedMrc, HasTheDocumentedFields) {
  MrcFile file;
  file.nx = 11;
  file.ny = 12;
  file.nz = 13;
  file.mode = 14;
  file.next = 15;
  file.nlabl = 16;
  file.labels = {std::string(80, 'l')};
  ExpectFields(Documented("MRC", "Offset"), file.Bytes(),
               {{"nx", Value(file.nx)},
                {"ny", Value(file.ny)},
                {"nz", Value(file.nz)},
                {"mode", Value(file.mode)},
                {"next", Value(*file.next)},
                {"nlabl", Value(*file.nlabl)},
                {"label", file.labels[0]}});
}

TEST(DocumentedMrc, FollowsTheDocumentedRules) {
  ExpectRules<MrcFileInfo>(Documented("MRC", "Offset"), 4, MrcFile{}, std::wstring(L"mrc"));
}

TEST(DocumentedMrc, HasTheDocumentedTypes) {
  const Table table = Documented("MRC", "Mode");
  EXPECT_EQ(table.size(), 7u);
  for (const Row& row : table) {
    const MrcFile file{.mode = Number(row[0])};
    ExpectType(OpenFile<MrcFileInfo>(file, std::wstring(L"mrc")), row[1], row[2]);
  }
}

TEST(DocumentedRaw, HasTheDocumentedFields) {
  RawFile file;
  file.word1 = 11;
  file.width = 12;
  file.height = 13;
  file.word4 = 14;
  file.bitsPerPixel = 15;
  file.valueClass = 16;
  file.offset = 17;
  file.pixelStride = -18;
  file.rowStride = -19;
  ExpectFields(Documented("RAW", "Offset"), file.Bytes(),
               {{"magic", file.magic},
                {"word1", Value(file.word1)},
                {"width", Value(file.width)},
                {"height", Value(file.height)},
                {"word4", Value(file.word4)},
                {"bitsPerPixel", Value(file.bitsPerPixel)},
                {"valueClass", Value(file.valueClass)},
                {"offset", Value(file.offset)},
                {"pixelStride", Value(file.pixelStride)},
                {"rowStride", Value(file.rowStride)}});
}

TEST(DocumentedRaw, FollowsTheDocumentedRules) {
  ExpectRules<RawFileInfo>(Documented("RAW", "Offset"), 2, RawFile{});
}

TEST(DocumentedRaw, HasTheDocumentedTypes) {
  const Table table = Documented("RAW", "Value class");
  EXPECT_EQ(table.size(), 12u);
  for (const Row& row : table) {
    RawFile file;
    file.valueClass = Number(row[0]);
    file.bitsPerPixel = Number(row[1]);
    ExpectType(OpenFile<RawFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEbn, HasTheDocumentedFields) {
  EbnFile file;
  file.typeCode = 11;
  file.width = 12;
  file.height = 13;
  file.dataOffset = 14;
  file.model = 15.5;
  file.source = 16.5;
  file.lens = 17.5;
  file.dNumber = 18.5;
  file.kilovolts = 19.5;
  ExpectFields(Documented("EBN", "Offset"), file.Bytes(),
               {{"typeCode", Value(file.typeCode)},
                {"width", Value(file.width)},
                {"height", Value(file.height)},
                {"dataOffset", Value(file.dataOffset)},
                {"model", Value(file.model)},
                {"source", Value(file.source)},
                {"lens", Value(file.lens)},
                {"dNumber", Value(file.dNumber)},
                {"kilovolts", Value(file.kilovolts)}});
}

TEST(DocumentedEbn, FollowsTheDocumentedRules) {
  ExpectRules<EbnFileInfo>(Documented("EBN", "Offset"), 4, EbnFile{});
}

TEST(DocumentedEbn, HasTheDocumentedTypes) {
  const Table table = Documented("EBN", "Code");
  EXPECT_EQ(table.size(), 8u);
  for (const Row& row : table) {
    EbnFile file;
    file.typeCode = static_cast<std::uint16_t>(Number(row[0]));
    ExpectType(OpenFile<EbnFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEbn, HasTheDocumentedTextsOfCodes) {
  const Table table = Documented("EBN", "Field");
  EXPECT_EQ(table.size(), 14u);
  const std::map<std::string, double EbnFile::*> fields = {
      {"model", &EbnFile::model}, {"source", &EbnFile::source}, {"lens", &EbnFile::lens}};
  for (const Row& row : table) {
    EbnFile file;
    const int code = Number(row[1]);
    file.*fields.at(row[0]) = code < 0 ? code - 0.6 : code;
    const std::wstring before = row[0] == "model" ? L"" : L" ";
    EXPECT_EQ(OpenFile<EbnFileInfo>(file)->GetComment(), before + Wide(row[2]) + L" 0.0 kV");
  }
}

SerFile Series() {
  SerFile file;
  file.byteOrder = 11;
  file.seriesId = 12;
  file.version = 13;
  file.dataTypeId = 14;
  file.tagTypeId = 15;
  file.totalElements = 16;
  file.validElements = 17;
  file.offsetArrayOffset = 18;
  file.dimensionCount = 19;
  return file;
}

TEST(DocumentedSer, HasTheDocumentedFields) {
  SerFile file = Series();
  ExpectFields(Documented("SER", "Offset"), file.Bytes(),
               {{"byteOrder", Value(file.byteOrder)},
                {"seriesId", Value(file.seriesId)},
                {"version", Value(file.version)},
                {"dataTypeId", Value(file.dataTypeId)},
                {"tagTypeId", Value(file.tagTypeId)},
                {"totalElements", Value(*file.totalElements)},
                {"validElements", Value(*file.validElements)},
                {"offsetArrayOffset", Value(*file.offsetArrayOffset)},
                {"dimensionCount", Value(*file.dimensionCount)}});
  file.version = 0x0220;
  ExpectFields(Documented("SER", "Offset from version 0x0220 on"), file.Bytes(),
               {{"offsetArrayOffset", Value(*file.offsetArrayOffset)},
                {"dimensionCount", Value(*file.dimensionCount)}});
}

TEST(DocumentedSer, FollowsTheDocumentedRules) {
  SerFile file;
  file.elements.resize(1);
  ExpectRules<SerFileInfo>(Documented("SER", "Offset"), 6, file);
}

TEST(DocumentedSer, HasTheDocumentedFieldsOfImages) {
  Testing::SerElement element;
  element.calibrationX = {11.5, 12.5, 13};
  element.calibrationY = {14.5, 15.5, 16};
  element.typeCode = 17;
  element.width = 18;
  element.height = 19;
  ExpectFields(Documented("SER", "Offset in an image"), element.Bytes(),
               {{"calibrationX.offset", Value(element.calibrationX.offset)},
                {"calibrationX.delta", Value(element.calibrationX.delta)},
                {"calibrationX.element", Value(element.calibrationX.element)},
                {"calibrationY.offset", Value(element.calibrationY.offset)},
                {"calibrationY.delta", Value(element.calibrationY.delta)},
                {"calibrationY.element", Value(element.calibrationY.element)},
                {"typeCode", Value(element.typeCode)},
                {"width", Value(element.width)},
                {"height", Value(element.height)}});
}

TEST(DocumentedSer, HasTheDocumentedTypes) {
  const Table table = Documented("SER", "Code");
  EXPECT_EQ(table.size(), 10u);
  for (const Row& row : table) {
    SerFile file;
    file.elements.resize(1);
    file.elements[0].typeCode = static_cast<std::int16_t>(Number(row[0]));
    ExpectType(OpenFile<SerFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEmi, HasTheDocumentedFields) {
  const EmiFile file{.magic = 11, .version = 12, .ignored = 13};
  ExpectFields(
      Documented("EMI", "Offset"), file.Bytes(),
      {{"magic", Value(file.magic)}, {"version", Value(file.version)}, {"ignored", Value(file.ignored)}});
}

TEST(DocumentedEmi, FollowsTheDocumentedRules) {
  ExpectRules<EmiFileInfo>(Documented("EMI", "Offset"), 2, OneImageEmiFile(0x2200, 1, 1, "x"));
}

/// Returns the number of images in a file where `item` and then an image are three levels deep: 1 if `item`
/// has the length that the reader skips.
int ImageCountAfter(const std::string& item) {
  const std::string items = EmiStructure(0x4000, 1, EmiStructure(0x4000, 1, item + EmiImageObject("")));
  return OpenFile<EmiFileInfo>(EmiFile{.items = items})->GetFrameCount();
}

TEST(DocumentedEmi, HasTheDocumentedLengthsOfValues) {
  std::size_t scalars = 0;
  std::map<std::string, std::uint16_t> others;
  for (const Row& row : Documented("EMI", "Type of an item")) {
    if (row[1].empty()) {
      others[row[2].substr(0, row[2].find_first_of(":,"))] =
          static_cast<std::uint16_t>(Number(row[0].substr(row[0].find("0x"))));
      continue;
    }
    for (const std::string& type : Split(row[0], ", ")) {
      const std::string value(static_cast<std::size_t>(Number(row[1])), '\xFF');
      EXPECT_EQ(ImageCountAfter(EmiScalar(static_cast<std::uint16_t>(Number(type)), 1, value)), 1) << type;
      ++scalars;
    }
  }
  EXPECT_EQ(scalars, 10u);

  ASSERT_EQ(others.size(), 3u);
  const std::uint16_t text = others["a text"];
  EXPECT_EQ(ImageCountAfter(EmiArray(text, 1, "\xFF\xFF\xFF")), 1);
  // Only a string is an error at the top level, so this shows that the type is a string.
  EXPECT_THROW(OpenFile<EmiFileInfo>(EmiFile{.items = EmiArray(text, 1, "x")}), std::exception);
  const std::uint16_t bit = others["an array"];
  EXPECT_TRUE(std::has_single_bit(bit));
  EXPECT_EQ(ImageCountAfter(EmiArray(bit, 1, "\xFF\xFF\xFF")), 1);
  EXPECT_EQ(ImageCountAfter(EmiArray(bit | 0x4001, 1, "\xFF\xFF\xFF")), 1);
  EXPECT_EQ(others["a list of items"], bit);
  const auto list = static_cast<std::uint16_t>(~bit);
  EXPECT_EQ(ImageCountAfter(EmiStructure(list, 1, EmiImageObject(""))), 2);
}

Facts EmiFacts(const std::string& items) {
  std::istringstream stream(EmiFile{.items = items}.Bytes());
  return HeaderFacts(stream, L"emi");
}

TEST(DocumentedEmi, HasTheDocumentedTagsOfLabels) {
  const Table table = Documented("EMI", "Tag of a text");
  EXPECT_EQ(table.size(), 4u);
  for (const Row& row : table) {
    const std::string text = EmiText(static_cast<std::uint16_t>(Number(row[0])), "text");
    EXPECT_EQ(EmiFacts(EmiImageObject(text)), (Facts{{"Image " + row[1], "text"}}));
  }
}

TEST(DocumentedEmi, HasTheDocumentedExtraValues) {
  const Table table = Documented("EMI", "Object");
  EXPECT_EQ(table.size(), 2u);
  for (const Row& row : table) {
    const auto number = [&row](std::size_t i) { return static_cast<std::uint16_t>(Number(row[i])); };
    const std::string values = EmiDouble(number(4), 1.5) + EmiDouble(number(5), 2.5);
    Facts facts = EmiFacts(EmiStructure(number(1), 0x0610, EmiStructure(number(2), number(3), values)));
    if (row[0] == "Line" && !facts.empty()) facts.erase(facts.begin());  // the number of lines
    EXPECT_EQ(facts, (Facts{{row[0] + " extra value 1", 1.5}, {row[0] + " extra value 2", 2.5}}));
  }
}

TEST(DocumentedEmi, HasTheDocumentedTypes) {
  const Table table = Documented("EMI", "Type of the array");
  EXPECT_EQ(table.size(), 10u);
  for (const Row& row : table) {
    const EmiFile file = OneImageEmiFile(static_cast<std::uint16_t>(Number(row[0])), 1, 1, "");
    const OpenFile<EmiFileInfo> emi(file);
    EXPECT_EQ(emi->GetDimensions(), (Size2{1, 1}));
    ExpectType(emi, row[1], row[2]);
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
