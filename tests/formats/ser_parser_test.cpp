#include "image_file_info.h"

#include <gtest/gtest.h>

#include <limits>
#include <stdexcept>

#include "memory_buffer.h"
#include "open_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BytesOf;
using Testing::SerDimension;
using Testing::SerFile;

using OpenSer = Testing::OpenFile<SerFileInfo>;

constexpr SIZE kWholeSize = {1000, 1000};  // larger than all frames here, so that none is reduced

using Bytes = std::vector<std::uint8_t>;

Testing::SerElement Image(std::uint32_t width, std::uint32_t height, std::string pixels) {
  Testing::SerElement element;
  element.width = width;
  element.height = height;
  element.pixels = std::move(pixels);
  return element;
}

SerFile OneImage() {
  SerFile file;
  file.elements = {Image(3, 2, BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255}))};
  return file;
}

bool IsValid(const SerFile& file) {
  return OpenSer(file)->IsValid();
}

TEST(Ser, ShowsItsImage) {
  const OpenSer ser(OneImage());
  ASSERT_TRUE(ser->IsValid());
  EXPECT_EQ(ser->GetDimensions(), (Size2{3, 2}));
  EXPECT_EQ(ser->GetFrameCount(), 1);
  EXPECT_EQ(ser->GetComment(), L"");
  EXPECT_EQ(ser->GetTypeDescription(), L"");
  EXPECT_EQ(ser.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
  EXPECT_EQ(ser.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ser, HasTheTypeOfItsCode) {
  struct Row {
    std::int32_t bits;
    const wchar_t* name;
  };
  constexpr Row kRows[] = {
      {8, L"8 bit unsigned"},        {16, L"16 bit unsigned"},
      {32, L"32 bit unsigned"},      {8, L"8 bit signed"},
      {16, L"16 bit signed"},        {32, L"32 bit signed"},
      {32, L"32 bit float"},         {64, L"64 bit float"},
      {64, L"64 bit complex float"}, {128, L"128 bit complex float"},
  };
  SerFile file = OneImage();
  for (std::int16_t code = 1; code <= 10; ++code) {
    file.elements[0].typeCode = code;
    const OpenSer ser(file);
    EXPECT_TRUE(ser->IsValid());
    EXPECT_EQ(ser->GetBitDepth(), kRows[code - 1].bits);
    EXPECT_EQ(ser->GetDataTypeName(), kRows[code - 1].name);
  }
  for (const std::int16_t code : std::initializer_list<std::int16_t>{0, 11, -1, 0x0101, -32768}) {
    file.elements[0].typeCode = code;
    EXPECT_FALSE(IsValid(file)) << code;
  }
}

TEST(Ser, RejectsOtherHeaders) {
  SerFile file = OneImage();
  file.byteOrder = 0x4D4D;
  EXPECT_FALSE(IsValid(file));
  file = OneImage();
  file.seriesId = 0x0196;
  EXPECT_FALSE(IsValid(file));
  file = OneImage();
  file.version = 0x020F;
  EXPECT_FALSE(IsValid(file));
}

TEST(Ser, RejectsImpossibleNumbersOfElements) {
  SerFile file = OneImage();
  file.validElements = 0;
  EXPECT_FALSE(IsValid(file));
  file.totalElements = 0;
  EXPECT_FALSE(IsValid(file));
  file.validElements = 1;
  EXPECT_FALSE(IsValid(file));
  file.totalElements = 1;
  EXPECT_TRUE(IsValid(file));

  file = OneImage();
  file.elements.push_back(Image(1, 1, "x"));
  file.validElements = 2;
  for (const std::uint32_t total : {1u, 2u, 3u}) {
    file.totalElements = total;
    EXPECT_EQ(IsValid(file), total >= 2) << total;
  }
}

TEST(Ser, RejectionFailsTheStreamAndKeepsNothing) {
  SerFile file = OneImage();
  file.version = 0x020F;
  OpenSer ser(file);
  EXPECT_TRUE(ser.stream().fail());
  EXPECT_EQ(ser->GetFrameCount(), 0);
}

TEST(Ser, RejectsUnknownKindsOfDataAndTags) {
  SerFile file = OneImage();
  file.dataTypeId = 0x4121;
  EXPECT_FALSE(IsValid(file));
  file = OneImage();
  for (const std::uint32_t tagTypeId : {0x4152u, 0x4142u}) {
    file.tagTypeId = tagTypeId;
    EXPECT_TRUE(IsValid(file));
  }
  file.tagTypeId = 0x4143;
  EXPECT_FALSE(IsValid(file));
}

TEST(Ser, AnUnknownKindOfTagsFailsOnlyTheStream) {
  // The kind of the elements is known before the kind of the tags is checked.
  SerFile file = OneImage();
  file.tagTypeId = 0x4143;
  OpenSer tags(file);
  EXPECT_TRUE(tags.stream().fail());
  tags.stream().clear();
  EXPECT_TRUE(tags->IsValid());

  file.dataTypeId = 0x4121;
  OpenSer data(file);
  data.stream().clear();
  EXPECT_FALSE(data->IsValid());

  file = OneImage();
  file.seriesId = 0x0196;
  OpenSer header(file);
  header.stream().clear();
  EXPECT_FALSE(header->IsValid());
}

TEST(Ser, SeriesOfLinesIsParsedButNotValid) {
  SerFile file = OneImage();
  file.dataTypeId = 0x4120;
  OpenSer ser(file);
  EXPECT_TRUE(ser.stream().good());
  EXPECT_FALSE(ser->IsValid());
  EXPECT_EQ(ser->GetFrameCount(), 1);
}

TEST(Ser, WideVersionsHaveALongerHeader) {
  SerFile file = OneImage();
  for (const std::uint16_t version : std::initializer_list<std::uint16_t>{0x0210, 0x021F, 0x0220, 0xFFFF}) {
    file.version = version;
    EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255})) << version;
  }
}

TEST(Ser, OnlyTheLowHalfOfAWideOffsetCounts) {
  SerFile file = OneImage();
  file.version = 0x0220;
  const std::string bytes = file.Bytes();
  file.offsetArrayOffset = (std::uint64_t{7} << 32) + bytes.size() - 2 * 4;
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ser, WideVersionsStillHaveNarrowEntries) {
  SerFile file = OneImage();
  file.version = 0x0220;
  file.dimensions.clear();
  file.elements.push_back(Image(1, 1, "x"));
  constexpr std::uint32_t kFirstElement = 34;
  const auto elementBytes = static_cast<std::uint32_t>(file.elements[0].Bytes().size());

  // The halves of the first 64-bit entry are the offsets of two elements.
  const std::uint64_t secondElement = kFirstElement + elementBytes;
  file.offsetArrays = BytesOf<std::uint64_t>({kFirstElement | (secondElement << 32), 0});
  EXPECT_EQ(OpenSer(file)->GetFrameCount(), 2);
  EXPECT_TRUE(IsValid(file));

  // The upper half of a genuine 64-bit offset is 0, where there is no element.
  file.offsetArrays = BytesOf<std::uint64_t>({kFirstElement, secondElement});
  EXPECT_FALSE(IsValid(file));
}

TEST(Ser, TagOffsetsFollowTheValidOffsets) {
  SerFile file = OneImage();
  file.totalElements = 3;
  // The tag's offset is the unused second offset. Nothing more is needed.
  EXPECT_TRUE(IsValid(file));
  EXPECT_EQ(OpenSer(file)->GetFrameCount(), 1);

  const std::string arrays = file.Bytes().substr(file.Bytes().size() - 8);
  file.offsetArrays = arrays.substr(0, 7);
  EXPECT_FALSE(IsValid(file));
  file.offsetArrays = arrays.substr(0, 4);
  EXPECT_FALSE(IsValid(file));
  file.offsetArrays = arrays.substr(0, 4) + "\xFF\xFF\xFF\xFF";
  EXPECT_TRUE(IsValid(file));
}

TEST(Ser, ShowsTheFirstOfManyImages) {
  SerFile file = OneImage();
  for (std::uint32_t i = 0; i < 3000; ++i) file.elements.push_back(Image(1, 1, "x"));
  const OpenSer ser(file);
  EXPECT_TRUE(ser->IsValid());
  EXPECT_EQ(ser->GetFrameCount(), 3001);
  EXPECT_EQ(ser->GetDimensions(), (Size2{3, 2}));
  EXPECT_EQ(ser.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));

  file.validElements = 2500;
  EXPECT_EQ(OpenSer(file)->GetFrameCount(), 2500);

  // Every element is checked, not only the first.
  file.elements[2499].typeCode = 11;
  EXPECT_FALSE(IsValid(file));
  file.validElements = 2499;
  EXPECT_TRUE(IsValid(file));
}

TEST(Ser, ElementsCanBeAnywhere) {
  SerFile file = OneImage();
  file.elements.push_back(Image(1, 1, "x"));
  const std::string bytes = file.Bytes();
  const std::string arrays = bytes.substr(bytes.size() - 4 * 4);
  file.offsetArrays = arrays.substr(4, 4) + arrays.substr(0, 4) + arrays.substr(8);
  EXPECT_EQ(OpenSer(file)->GetDimensions(), (Size2{1, 1}));

  file.offsetArrays = BytesOf<std::uint32_t>({0xFFFFFFFF, 0, 0, 0});
  EXPECT_FALSE(IsValid(file));
}

TEST(Ser, OffsetArraysCanComeFirst) {
  SerFile file = OneImage();
  file.dimensions.clear();
  const std::string elementBytes = file.elements[0].Bytes();
  file.elements.clear();
  file.totalElements = 1;
  file.validElements = 1;
  file.offsetArrayOffset = 30;
  file.offsetArrays = BytesOf<std::uint32_t>({30 + 8, 0}) + elementBytes;
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ser, ReadsAnyNumberOfDimensionsWithStringsOfAnyLength) {
  SerFile file = OneImage();
  file.dimensions.clear();
  EXPECT_TRUE(IsValid(file));
  SerDimension dimension;
  for (const std::size_t length : {0u, 1u, 511u, 512u, 513u, 5000u}) {
    dimension.description = std::string(length, 'd');
    dimension.units = std::string(length + 1, 'u');
    file.dimensions.push_back(dimension);
  }
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ser, NegativeStringLengthIsALengthError) {
  for (const std::int32_t length : {-1, std::numeric_limits<std::int32_t>::min()}) {
    SerFile file = OneImage();
    file.dimensions[0].descriptionLength = length;
    EXPECT_THROW(OpenSer{file}, std::length_error);
    file = OneImage();
    file.dimensions[0].unitsLength = length;
    EXPECT_THROW(OpenSer{file}, std::length_error);
    file.dataTypeId = 0x4120;
    EXPECT_THROW(OpenSer{file}, std::length_error);
    // A length that is not read cannot cause an exception.
    file.dimensionCount = 0;
    EXPECT_NO_THROW(OpenSer{file});
  }
}

TEST(Ser, MissingStringsAndDimensionsFailTheFile) {
  constexpr std::int32_t kMax = std::numeric_limits<std::int32_t>::max();
  SerFile file = OneImage();
  file.dimensions[0].descriptionLength = kMax;
  EXPECT_FALSE(IsValid(file));
  file = OneImage();
  file.dimensions[0].unitsLength = kMax;
  EXPECT_FALSE(IsValid(file));

  // The last string ends with the file, then one byte beyond it.
  file = OneImage();
  const std::string bytes = file.Bytes();
  const std::size_t units = 30 + 4 + 20 + 4 + file.dimensions[0].description.size() + 4;
  file.dimensions[0].unitsLength = static_cast<std::int32_t>(bytes.size() - units);
  EXPECT_TRUE(IsValid(file));
  ++*file.dimensions[0].unitsLength;
  EXPECT_FALSE(IsValid(file));

  file = OneImage();
  file.dimensionCount = std::numeric_limits<std::uint32_t>::max();
  file.elements[0].pixels = std::string(6, '\0');
  EXPECT_FALSE(IsValid(file));
}

TEST(Ser, MissingElementsFailTheFile) {
  SerFile file = OneImage();
  for (const std::uint32_t count : {2u, 0x40000000u, 0x80000000u, 0xFFFFFFFFu}) {
    file.totalElements = count;
    file.validElements = count;
    EXPECT_FALSE(IsValid(file)) << count;
  }
  file = OneImage();
  for (const std::uint64_t offset : {std::uint64_t{0xFFFFFFFF}, std::uint64_t{file.Bytes().size()}}) {
    file.offsetArrayOffset = offset;
    EXPECT_FALSE(IsValid(file)) << offset;
  }
}

/// The offsets of this series of 2000 elements begin just below 4 GiB. All are 0, so the header also serves
/// as the element. The bytes shortly after the header are neither an offset nor an element.
TEST(Ser, OffsetArraysCanPass4GiB) {
  constexpr std::uint32_t kArrays = 0xFFFFFFF0;
  constexpr std::uint32_t kCount = 2000;
  SerFile file;
  file.dimensions.clear();
  file.totalElements = kCount;
  file.validElements = kCount;
  file.offsetArrayOffset = kArrays;
  file.offsetArrays = std::string(10, '\0') + BytesOf<std::int16_t>({1}) + BytesOf<std::uint32_t>({1, 1}) +
                      std::string(20'000, '\xFF');
  const std::string head = file.Bytes();
  const auto isValid = [&head](std::int64_t size) {
    Testing::MemoryBuffer buffer(head);
    buffer.trailingZeros = size - static_cast<std::int64_t>(head.size());
    std::istream stream(&buffer);
    return SerFileInfo(stream).IsValid();
  };
  constexpr std::int64_t kEnd = kArrays + std::int64_t{8} * kCount;
  EXPECT_TRUE(isValid(kEnd));
  EXPECT_FALSE(isValid(kEnd - 1));
}

TEST(Ser, AnElementJustBelow4GiBHasItsPixelsAbove) {
  constexpr std::uint32_t kElement = 0xFFFFFFF0;
  constexpr std::uint32_t kArrays = 30;
  SerFile file;
  file.dimensions.clear();
  file.totalElements = 1;
  file.validElements = 1;
  file.offsetArrayOffset = kArrays;
  file.offsetArrays = BytesOf<std::uint32_t>({kElement, 0});
  const std::string head = file.Bytes();
  const std::string element = Image(3, 2, BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255})).Bytes();
  Testing::MemoryBuffer buffer(head);
  buffer.trailingZeros = kElement - static_cast<std::int64_t>(head.size());
  buffer.tail = element;
  std::istream stream(&buffer);
  const SerFileInfo ser(stream);
  ASSERT_TRUE(ser.IsValid());
  EXPECT_EQ(Testing::TakeBitmap(ser.CreateThumbnail(kWholeSize)).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ser, HugeImagesHaveNoThumbnail) {
  SerFile file = OneImage();
  file.elements[0].typeCode = 10;
  for (const std::uint32_t edge : {0u, 0x8000u, 0x10000u, 0x7FFFFFFFu, 0x80000001u, 0xFFFFFFFFu}) {
    file.elements[0].width = edge;
    file.elements[0].height = edge;
    const OpenSer ser(file);
    EXPECT_TRUE(ser->IsValid());
    EXPECT_EQ(ser->GetDimensions().width, static_cast<std::int32_t>(edge));
    EXPECT_EQ(ser.Thumbnail({256, 256}).width, 0) << edge;
  }
}

TEST(Ser, ShortImageHasNoThumbnail) {
  SerFile file;
  file.dimensions.clear();
  file.totalElements = 1;
  file.validElements = 1;
  file.offsetArrayOffset = 30;
  const std::string element = Image(3, 2, "012345").Bytes();
  file.offsetArrays = BytesOf<std::uint32_t>({30 + 8, 0}) + element;
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).width, 3);
  file.offsetArrays->pop_back();
  EXPECT_TRUE(IsValid(file));
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).width, 0);
}

TEST(Ser, BlackComplexImageIsBlack) {
  SerFile file;
  file.elements = {Image(2, 2, std::string(4 * 8, '\0'))};
  file.elements[0].typeCode = 9;
  EXPECT_EQ(OpenSer(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 0, 0, 0}));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
