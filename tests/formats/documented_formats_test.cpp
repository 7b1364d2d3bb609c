// The tables of docs/formats.md against the readers and the writers of the tests; the current folder is docs.
#include <gtest/gtest.h>

#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "byte_order.h"
#include "ebn_file.h"
#include "ebn_file_info.h"
#include "emi_file.h"
#include "emi_file_info.h"
#include "mrc_file.h"
#include "mrc_file_info.h"
#include "open_file.h"
#include "raw_file.h"
#include "raw_file_info.h"
#include "ser_file.h"
#include "ser_file_info.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

using Row = std::vector<std::string>;
using Table = std::vector<Row>;

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

/// The rows of the table in section `section` whose first column is called `column`.
Table Documented(const std::string& section, const std::string& column) {
  std::ifstream file("formats.md");
  EXPECT_TRUE(file.is_open());
  Table table;
  bool inSection = false;
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

std::wstring Wide(const std::string& text) {
  return {text.begin(), text.end()};
}

/// The value of a field, as text, so that numbers of all types can be compared.
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

/// Whether every documented field is where it is said to be; `fields` are all of them.
void ExpectFields(const Table& table, const std::string& bytes, const Fields& fields) {
  EXPECT_EQ(table.size(), fields.size());
  for (const Row& row : table) {
    const auto field = fields.find(row[2]);
    ASSERT_NE(field, fields.end()) << row[2];
    EXPECT_EQ(ValueAt(bytes, row), field->second) << row[2];
  }
}

/// Whether the reader of a file with one of the documented types answers its bits and its name.
template <class Reader>
void ExpectType(const OpenFile<Reader>& file, const std::string& bits, const std::string& name) {
  EXPECT_TRUE(file->IsValid()) << name;
  EXPECT_EQ(file->GetBitDepth(), Number(bits)) << name;
  EXPECT_EQ(file->GetDataTypeName(), Wide(name));
}

TEST(DocumentedMrc, FieldsAreWhereTheyAre) {
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

TEST(DocumentedMrc, TypesAreWhatTheyAre) {
  const Table table = Documented("MRC", "Mode");
  EXPECT_EQ(table.size(), 7u);
  for (const Row& row : table) {
    const MrcFile file{.mode = Number(row[0])};
    ExpectType(OpenFile<MrcFileInfo>(file, std::wstring(L"mrc")), row[1], row[2]);
  }
}

TEST(DocumentedRaw, FieldsAreWhereTheyAre) {
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

TEST(DocumentedRaw, TypesAreWhatTheyAre) {
  const Table table = Documented("RAW", "Value class");
  EXPECT_EQ(table.size(), 12u);
  for (const Row& row : table) {
    RawFile file;
    file.valueClass = Number(row[0]);
    file.bitsPerPixel = Number(row[1]);
    ExpectType(OpenFile<RawFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEbn, FieldsAreWhereTheyAre) {
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

TEST(DocumentedEbn, TypesAreWhatTheyAre) {
  const Table table = Documented("EBN", "Code");
  EXPECT_EQ(table.size(), 8u);
  for (const Row& row : table) {
    EbnFile file;
    file.typeCode = static_cast<std::uint16_t>(Number(row[0]));
    ExpectType(OpenFile<EbnFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEbn, CodesHaveTheirTexts) {
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

TEST(DocumentedSer, FieldsAreWhereTheyAre) {
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

TEST(DocumentedSer, FieldsOfImagesAreWhereTheyAre) {
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

TEST(DocumentedSer, TypesAreWhatTheyAre) {
  const Table table = Documented("SER", "Code");
  EXPECT_EQ(table.size(), 10u);
  for (const Row& row : table) {
    SerFile file;
    file.elements.resize(1);
    file.elements[0].typeCode = static_cast<std::int16_t>(Number(row[0]));
    ExpectType(OpenFile<SerFileInfo>(file), row[1], row[2]);
  }
}

TEST(DocumentedEmi, FieldsAreWhereTheyAre) {
  const EmiFile file{.magic = 11, .version = 12, .ignored = 13};
  ExpectFields(
      Documented("EMI", "Offset"), file.Bytes(),
      {{"magic", Value(file.magic)}, {"version", Value(file.version)}, {"ignored", Value(file.ignored)}});
}

TEST(DocumentedEmi, ValuesAreAsLongAsTheyAre) {
  int types = 0;
  for (const Row& row : Documented("EMI", "Type of an item")) {
    if (row[1].empty()) continue;
    std::istringstream list(row[0]);
    for (std::string type; std::getline(list, type, ','); ++types) {
      const std::string value(static_cast<std::size_t>(Number(row[1])), '\xFF');
      const std::string item = EmiScalar(static_cast<std::uint16_t>(Number(type)), 1, value);
      // Any other length would lead past the image or end the list before it.
      const std::string items = EmiStructure(0x4000, 1, EmiStructure(0x4000, 1, item)) + EmiImageObject("");
      EXPECT_EQ(OpenFile<EmiFileInfo>(EmiFile{.items = items})->GetFrameCount(), 1) << type;
    }
  }
  EXPECT_EQ(types, 10);
}

TEST(DocumentedEmi, TypesAreWhatTheyAre) {
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
