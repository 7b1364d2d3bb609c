// Tests files of every kind, truncated at every byte.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "bitmap_pixels.h"
#include "ebn_file.h"
#include "emi_file.h"
#include "file_type_factory.h"
#include "mrc_file.h"
#include "path_stream.h"
#include "raw_file.h"
#include "ser_file.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

struct Specimen {
  std::wstring extension;
  std::string bytes;
  std::size_t validFrom;  // the smallest length of a valid file
  std::size_t shownFrom;  // the smallest length of a file with a thumbnail
};

Specimen MrcSpecimen() {
  MrcFile file;
  file.nx = 3;
  file.ny = 2;
  file.nz = 2;
  file.mode = 1;
  file.extendedHeader = "extended";
  file.pixels = std::string(2 * 12, 'x');
  return {L"mrc", file.Bytes(), 1024, 1024 + 8 + 2 * 12};
}

Specimen RawSpecimen() {
  const std::string bytes = PackedRawFile(DataType::kFloat32, 3, 2, std::string(24, 'x')).Bytes();
  return {L"raw", bytes, 49, 49 + 24};
}

Specimen EbnSpecimen() {
  EbnFile file;
  file.typeCode = 8;
  file.width = 2;
  file.dataOffset = 60;
  file.afterHeader = std::string(6 + 16, 'x');
  return {L"ebn", file.Bytes(), 54, 60 + 16};
}

SerFile TwoImageSeries() {
  SerFile file;
  file.elements.resize(2);
  file.elements[0].width = 5;
  file.elements[0].pixels = "01234";
  file.dimensions[0].units = "nm";
  return file;
}

Specimen SerSpecimen() {
  const std::string bytes = TwoImageSeries().Bytes();
  return {L"ser", bytes, bytes.size(), bytes.size()};  // its index comes last
}

Specimen WideSerSpecimen() {
  SerFile file = TwoImageSeries();
  file.version = 0x0220;
  const std::string bytes = file.Bytes();
  return {L"ser", bytes, bytes.size(), bytes.size()};
}

Specimen SerWithIndexFirstSpecimen() {
  SerFile file = TwoImageSeries();
  const std::string element = file.elements[0].Bytes();
  file.elements.clear();
  file.totalElements = 1;
  file.validElements = 1;
  file.dimensions.clear();
  file.offsetArrayOffset = 30;
  file.offsetArrays = BytesOf<std::uint32_t>({38, 0}) + element;
  return {L"ser", file.Bytes(), 38 + 50, 38 + 50 + 5};
}

Specimen EmiSpecimen() {
  const std::string before = EmiScalar(0x0034, 1, "12345678") +
                             EmiStructure(0x4000, 1, EmiText(2, "text") + EmiArray(0x2060, 3, "array"));
  const std::string opening = EmiOpening(0x49B0, 0x0610);
  const std::string label = EmiText(0x0100, "label");
  const std::string pixels = "012345";
  const std::string picture = EmiPixelArray(0x2202, 3, 2, pixels);
  const std::string after = EmiStructure(0x4102, 0x0300, EmiDouble(0x0120, 1.5)) + EmiEnd() + EmiEnd();
  EmiFile file;
  file.items = before + opening;
  const std::size_t validFrom = file.Bytes().size();
  file.items += label + picture;
  const std::size_t shownFrom = file.Bytes().size();
  file.items += after;
  return {L"emi", file.Bytes(), validFrom, shownFrom};
}

void ExpectAnswers(std::istream& stream, const Specimen& specimen, std::size_t length) {
  const auto reader = CreateFileTypeInfo(stream, specimen.extension);
  EXPECT_EQ(reader->IsValid(), length >= specimen.validFrom) << length;
  if (!reader->IsValid()) return;
  EXPECT_EQ(TakeBitmap(reader->CreateThumbnail({1000, 1000})).width > 0, length >= specimen.shownFrom)
      << length;
}

class TruncatedFile : public testing::TestWithParam<Specimen> {};

TEST_P(TruncatedFile, InMemoryIsAcceptedFromItsSmallestLengthOn) {
  for (std::size_t length = 0; length <= GetParam().bytes.size(); ++length) {
    std::istringstream stream(GetParam().bytes.substr(0, length));
    ExpectAnswers(stream, GetParam(), length);
  }
}

// Unlike a stream in memory, a file can be positioned after its end.
TEST_P(TruncatedFile, OnDiskIsAcceptedFromItsSmallestLengthOn) {
  const TempFolder folder;
  const std::filesystem::path path = folder.Write("file", GetParam().bytes);
  for (std::size_t length = GetParam().bytes.size();; --length) {
    std::filesystem::resize_file(path, length);
    std::ifstream stream;
    OpenPath(stream, path.wstring().c_str());
    ASSERT_TRUE(stream.good());
    ExpectAnswers(stream, GetParam(), length);
    if (length == 0) break;
  }
}

std::string NameOf(const testing::TestParamInfo<Specimen>& specimen) {
  const std::wstring& extension = specimen.param.extension;
  return std::string(extension.begin(), extension.end()) + std::to_string(specimen.index);
}

INSTANTIATE_TEST_SUITE_P(AllKinds, TruncatedFile,
                         testing::Values(MrcSpecimen(), RawSpecimen(), EbnSpecimen(), SerSpecimen(),
                                         WideSerSpecimen(), SerWithIndexFirstSpecimen(), EmiSpecimen()),
                         NameOf);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
