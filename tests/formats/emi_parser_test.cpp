#include "image_file_info.h"

#include <gtest/gtest.h>

#include <stdexcept>

#include "emi_file.h"
#include "open_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

using OpenEmi = OpenFile<EmiFileInfo>;

constexpr SIZE kWholeSize = {1000, 1000};  // larger than all frames here, so that none is reduced
constexpr std::uint16_t kUInt8Image = 0x2202;
constexpr std::uint16_t kPlainStructure = 0x4100;

using Bytes = std::vector<std::uint8_t>;

std::string Picture() {
  return EmiPixelArray(kUInt8Image, 3, 2, BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255}));
}

/// Expects that the reader skips the other items and finds the picture that Picture() makes.
void ExpectPicture(const std::string& items) {
  const OpenEmi emi(EmiFile{.items = items});
  EXPECT_TRUE(emi->IsValid());
  EXPECT_EQ(emi->GetDimensions(), (Size2{3, 2}));
  EXPECT_EQ(emi.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

/// Returns the number of images in a file of these items.
std::int32_t ImageCount(const std::string& items) {
  return OpenEmi(EmiFile{.items = items})->GetFrameCount();
}

void ExpectBadIndex(const std::string& items) {
  try {
    const OpenEmi emi(EmiFile{.items = items});
    ADD_FAILURE() << "no exception was thrown";
  } catch (const std::invalid_argument& error) {
    EXPECT_STREQ(error.what(), "bad EMI object index");
  }
}

TEST(Emi, ShowsItsImage) {
  const OpenEmi emi(EmiFile{.items = EmiImageObject(Picture()) + EmiEnd()});
  ASSERT_TRUE(emi->IsValid());
  EXPECT_EQ(emi->GetDimensions(), (Size2{3, 2}));
  EXPECT_EQ(emi->GetFrameCount(), 1);
  EXPECT_EQ(emi->GetBitDepth(), 8);
  EXPECT_EQ(emi->GetDataTypeName(), L"8 bit unsigned");
  EXPECT_EQ(emi->GetComment(), L"VRA EMI File");
  EXPECT_EQ(emi->GetTypeDescription(), L"");
  EXPECT_EQ(emi.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
  EXPECT_EQ(emi.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Emi, HasTheTypeOfItsArray) {
  struct Row {
    std::uint16_t arrayType;
    std::int32_t bits;
    const wchar_t* name;
  };
  constexpr Row kRows[] = {
      {0x2200, 8, L"8 bit signed"},
      {0x2202, 8, L"8 bit unsigned"},
      {0x2204, 16, L"16 bit signed"},
      {0x2206, 16, L"16 bit unsigned"},
      {0x2208, 32, L"32 bit signed"},
      {0x220A, 32, L"32 bit unsigned"},
      {0x220C, 32, L"32 bit float"},
      {0x220E, 64, L"64 bit float"},
      {0x2212, 128, L"128 bit complex float"},
      {0x2214, 64, L"64 bit complex float"},
  };
  for (const Row& row : kRows) {
    const OpenEmi emi(OneImageEmiFile(row.arrayType, 1, 1, std::string(16, '\0')));
    EXPECT_TRUE(emi->IsValid());
    EXPECT_EQ(emi->GetDimensions(), (Size2{1, 1}));
    EXPECT_EQ(emi->GetBitDepth(), row.bits);
    EXPECT_EQ(emi->GetDataTypeName(), row.name);
    EXPECT_EQ(emi.Thumbnail(kWholeSize).width, 1);
  }
}

TEST(Emi, OtherArraysDoNotChangeTheImage) {
  for (const std::uint16_t arrayType :
       std::initializer_list<std::uint16_t>{0x2201, 0x2203, 0x220D, 0x220F, 0x2210, 0x2211, 0x2213, 0x2215,
                                            0x2216, 0x2102, 0x2302, 0x6202, 0xA202}) {
    SCOPED_TRACE(arrayType);
    const std::string other = EmiPixelArray(arrayType, 7, 7, std::string(49, 'x'));
    const OpenEmi alone(EmiFile{.items = EmiImageObject(other)});
    EXPECT_TRUE(alone->IsValid());
    EXPECT_EQ(alone->GetDimensions(), (Size2{0, 0}));
    EXPECT_EQ(alone->GetDataTypeName(), L"8 bit unsigned");
    EXPECT_EQ(alone.Thumbnail(kWholeSize).width, 0);
    ExpectPicture(EmiImageObject(other + Picture()));
    ExpectPicture(EmiImageObject(Picture() + other));
  }
}

TEST(Emi, IgnoresAnArrayWithAnotherTag) {
  std::string array = Picture();
  array[2] = 0x03;
  EXPECT_EQ(OpenEmi(EmiFile{.items = EmiImageObject(array)})->GetDimensions(), (Size2{0, 0}));
  ExpectPicture(EmiImageObject(array + Picture()));
}

TEST(Emi, IgnoresAnArrayOfAnotherObject) {
  const std::string deeper = EmiStructure(kPlainStructure, 0x0610, Picture());
  EXPECT_EQ(OpenEmi(EmiFile{.items = EmiImageObject(deeper)})->GetDimensions(), (Size2{0, 0}));
  const std::string lines = EmiLineDataObject(Picture());
  EXPECT_EQ(OpenEmi(EmiFile{.items = EmiImageObject(lines)})->GetDimensions(), (Size2{0, 0}));
  // An image object needs both its type and its tag.
  EXPECT_EQ(ImageCount(EmiStructure(0x49B0, 0x0611, Picture())), 0);
  EXPECT_EQ(ImageCount(EmiStructure(0x49B1, 0x0610, Picture())), 0);
  EXPECT_EQ(ImageCount(EmiLineDataObject(Picture())), 0);
}

TEST(Emi, UsesTheLastArrayOfAnImage) {
  const std::string first = EmiPixelArray(0x220E, 1, 1, BytesOf({1.0}));
  ExpectPicture(EmiImageObject(first + Picture()));
}

TEST(Emi, ShowsTheFirstOfTwoImages) {
  const std::string second = EmiImageObject(EmiPixelArray(0x2206, 1, 1, "xx"));
  const std::string items = EmiImageObject(Picture()) + second;
  EXPECT_EQ(ImageCount(items), 2);
  ExpectPicture(items);
  // An array belongs to the image that was opened last, even after that image has been closed.
  const OpenEmi nested(EmiFile{.items = EmiImageObject(second + Picture())});
  EXPECT_EQ(nested->GetFrameCount(), 2);
  EXPECT_EQ(nested->GetDimensions(), (Size2{0, 0}));
  ExpectPicture(EmiImageObject(Picture() + second));
}

TEST(Emi, RejectsOtherHeaders) {
  EmiFile file = OneImageEmiFile(kUInt8Image, 1, 1, "x");
  file.ignored = 0xFFFFFFFF;
  EXPECT_TRUE(OpenEmi(file)->IsValid());
  file.magic = 0x4A4B;
  EXPECT_FALSE(OpenEmi(file)->IsValid());
  EXPECT_EQ(OpenEmi(file)->GetFrameCount(), 0);
}

TEST(Emi, VersionIsASignedNumberOfAtMost0x0200) {
  EmiFile file = OneImageEmiFile(kUInt8Image, 1, 1, "x");
  for (const std::uint16_t version :
       std::initializer_list<std::uint16_t>{0x0000, 0x0001, 0x01FF, 0x0200, 0x8000, 0xFFFF}) {
    file.version = version;
    EXPECT_TRUE(OpenEmi(file)->IsValid()) << version;
  }
  for (const std::uint16_t version : std::initializer_list<std::uint16_t>{0x0201, 0x0300, 0x7FFF}) {
    file.version = version;
    EXPECT_FALSE(OpenEmi(file)->IsValid()) << version;
  }
}

TEST(Emi, FileOfOnlyTheHeaderIsNotValid) {
  EXPECT_FALSE(OpenEmi(EmiFile{})->IsValid());
  EXPECT_FALSE(OpenEmi(EmiFile{.items = EmiEnd()})->IsValid());
}

TEST(Emi, TraversalLeavesTheStreamGood) {
  OpenEmi emi(EmiFile{.items = EmiOpening(0x49B0, 0x0610)});
  EXPECT_TRUE(emi.stream().good());
  EXPECT_TRUE(emi->IsValid());
}

TEST(Emi, StaysValidWhenItsPixelsCannotBeRead) {
  OpenEmi emi(OneImageEmiFile(kUInt8Image, 4, 4, "too few"));
  EXPECT_EQ(emi.Thumbnail(kWholeSize).width, 0);
  EXPECT_TRUE(emi.stream().fail());
  EXPECT_TRUE(emi->IsValid());
  emi.stream().setstate(std::ios_base::badbit);
  EXPECT_FALSE(emi->IsValid());
}

TEST(Emi, SkipsEveryKindOfValue) {
  struct Row {
    std::uint16_t type;
    std::size_t bytes;
  };
  constexpr Row kRows[] = {{0x0010, 1}, {0x0020, 1}, {0x0070, 1}, {0x0030, 2}, {0x0032, 2},
                           {0x0031, 4}, {0x0033, 4}, {0x0034, 8}, {0x0040, 4}};
  std::string all;
  for (const Row& row : kRows) {
    const std::string item = EmiScalar(row.type, 0x0202, std::string(row.bytes, '\xFF'));
    ExpectPicture(item + EmiImageObject(item + Picture()));
    all += item;
  }
  all += EmiArray(0x2000, 1, "0123456789");
  all += EmiArray(0x2060, 1, "");
  all += EmiArray(0xFFFF, 1, std::string(10000, 'x'));
  all += EmiStructure(0x0001, 0, all);
  all += EmiStructure(0xDFFF, 0, EmiText(0, "text") + EmiStructure(kPlainStructure, 0, EmiDouble(0, 1.5)));
  ExpectPicture(all + EmiImageObject(all + Picture() + all) + all);
}

TEST(Emi, EndOfTheTopLevelListEndsTheFile) {
  ExpectPicture(EmiImageObject(Picture()) + EmiEnd() + EmiImageObject(Picture()));
  EXPECT_EQ(ImageCount(EmiImageObject(Picture()) + EmiEnd() + EmiImageObject(Picture())), 1);
  EXPECT_EQ(ImageCount(EmiEnd() + EmiImageObject(Picture())), 0);
}

TEST(Emi, SkipsStringsOfImagesAndLines) {
  std::string texts;
  for (const std::uint16_t tag :
       std::initializer_list<std::uint16_t>{0x0100, 0x0400, 0x0419, 0x0440, 0x0441}) {
    texts += EmiText(tag, "label") + EmiText(tag, "") + EmiText(tag, std::string(2000, 'x'));
  }
  ExpectPicture(EmiLineDataObject(texts) + EmiImageObject(texts + Picture() + texts));
}

TEST(Emi, SkipsDoublesOfImagesAndLines) {
  const std::string doubles = EmiDouble(0x0100, 1) + EmiDouble(0x0120, 2) + EmiDouble(0x0130, 3);
  ExpectPicture(EmiLineDataObject(EmiStructure(0x4100, 0x0300, doubles) + EmiArray(0x2102, 0x0202, "4567")) +
                EmiImageObject(EmiStructure(0x4102, 0x0300, doubles) + Picture()));
}

TEST(Emi, StringAtTheTopIsABadIndex) {
  ExpectBadIndex(EmiText(0x0100, "text"));
  ExpectBadIndex(EmiImageObject(Picture()) + EmiText(0x0100, "text"));
  ExpectBadIndex(EmiOpening(0x0060, 0x0100));  // even if the file ends with it
}

TEST(Emi, DoubleLessThanThreeDeepIsABadIndex) {
  ExpectBadIndex(EmiDouble(0x0120, 1));
  ExpectBadIndex(EmiImageObject(EmiDouble(0x0120, 1)));
  ExpectBadIndex(EmiImageObject(EmiOpening(0x0041, 0x0120)));
  EXPECT_EQ(ImageCount(EmiImageObject(EmiStructure(0x4102, 0x0300, EmiDouble(0x0120, 1)))), 1);
}

TEST(Emi, DataArrayAtTheTopIsABadIndex) {
  for (const int group : {0x2100, 0x2200}) {
    for (int elementType = 0; elementType <= 0x16; ++elementType) {
      const auto type = static_cast<std::uint16_t>(group + elementType);
      SCOPED_TRACE(type);
      const std::string array = EmiArray(type, 0x0001, "01234567");
      if (elementType % 2 == 0 && elementType <= 0x14) {
        ExpectBadIndex(array);
        ExpectBadIndex(EmiOpening(type, 0x0001));
      } else {
        ExpectPicture(array + EmiImageObject(Picture()));
      }
      ExpectPicture(EmiStructure(kPlainStructure, 0, array) + EmiImageObject(Picture()));
    }
  }
}

TEST(Emi, ByteCountGivesThePositionOfTheNextItem) {
  const std::string pixels = BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255});
  const std::string payload = FileBytes().Put(std::uint32_t{3}).Put(std::uint32_t{2}).Text(pixels).bytes();
  const std::string second = EmiImageObject("");
  // The array has more bytes than the picture needs.
  const std::string longer = EmiArray(kUInt8Image, 0x0202, payload + std::string(1000, 'x'));
  EXPECT_EQ(ImageCount(EmiImageObject(longer) + second), 2);
  ExpectPicture(EmiImageObject(longer) + second);
  // The array has fewer bytes: the rest of the picture is read as the next item.
  const std::string shorter = EmiArray(kUInt8Image, 0x0202, payload, 12);  // leaves out the bytes 4 and 255
  ExpectPicture(EmiImageObject(shorter) + second);
  EXPECT_EQ(ImageCount(EmiImageObject(shorter) + second), 1);
}

TEST(Emi, ByteCountMayLeadBackToTheWidth) {
  // The bytes of the width 0x0010 and the height 0x0000 are then read as a one-byte item with the value 0 and
  // an end marker.
  const std::string array = EmiArray(kUInt8Image, 0x0202, FileBytes().Put(0x0010).Put(0).bytes(), 0);
  const OpenEmi emi(EmiFile{.items = EmiImageObject(array) + EmiEnd()});
  EXPECT_EQ(emi->GetDimensions(), (Size2{0x10, 0}));
  EXPECT_EQ(emi->GetFrameCount(), 1);
  EXPECT_EQ(emi.Thumbnail(kWholeSize).width, 0);
}

TEST(Emi, MissingWidthAndHeightEndTheTraversal) {
  // The array claims to have no bytes, but its width and height are read nevertheless.
  const std::string empty = EmiOpening(0x49B0, 0x0610) + EmiArray(kUInt8Image, 0x0202, "") + EmiEnd();
  const std::string opening = EmiOpening(0x49B0, 0x0610);
  EXPECT_EQ(ImageCount(empty + opening), 1);
  EXPECT_EQ(ImageCount(EmiImageObject(Picture()) + empty + opening), 2);
  EXPECT_EQ(ImageCount(EmiImageObject(Picture()) + empty + opening + EmiEnd()), 3);
}

TEST(Emi, LengthsBeyondTheEndOfTheFileEndTheTraversal) {
  for (const std::uint32_t length : {100u, 1000u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFF0u, 0xFFFFFFFFu}) {
    SCOPED_TRACE(length);
    const std::string second = EmiImageObject("");
    EXPECT_EQ(ImageCount(EmiImageObject(EmiText(0x0100, "text", length)) + second), 1);
    EXPECT_EQ(ImageCount(EmiImageObject(EmiArray(0x2060, 0x0100, "text", length)) + second), 1);
    const std::string picture = EmiArray(kUInt8Image, 0x0202, Picture().substr(8), length);
    EXPECT_EQ(ImageCount(EmiImageObject(picture) + second), 1);
    ExpectPicture(EmiImageObject(picture) + second);
  }
}

TEST(Emi, ImageWithoutAnArrayIsEmpty) {
  const OpenEmi emi(EmiFile{.items = EmiImageObject("")});
  EXPECT_TRUE(emi->IsValid());
  EXPECT_EQ(emi->GetDimensions(), (Size2{0, 0}));
  EXPECT_EQ(emi->GetBitDepth(), 8);
  EXPECT_EQ(emi->GetDataTypeName(), L"8 bit unsigned");
  EXPECT_EQ(emi.Thumbnail(kWholeSize).width, 0);
}

TEST(Emi, HugeImagesHaveNoThumbnail) {
  for (const std::uint32_t edge : {0x8000u, 0x10000u, 0x7FFFFFFFu, 0x80000001u, 0xFFFFFFFFu}) {
    const OpenEmi emi(OneImageEmiFile(0x2212, edge, edge, std::string(64, 'x')));
    EXPECT_TRUE(emi->IsValid());
    EXPECT_EQ(emi->GetDimensions().height, static_cast<std::int32_t>(edge));
    EXPECT_EQ(emi.Thumbnail({256, 256}).width, 0) << edge;
  }
}

TEST(Emi, TreeCanBeOfAnyDepth) {
  std::string opening;
  std::string ends;
  for (int i = 0; i < 0x40000; ++i) {
    opening += EmiOpening(kPlainStructure, 0x0300);
    ends += EmiEnd();
  }
  const std::string image = EmiImageObject(Picture());
  ExpectPicture(opening + image);
  ExpectPicture(opening + image + ends);
  EXPECT_EQ(ImageCount(opening + ends + image), 1);
  EXPECT_EQ(ImageCount(opening + ends + EmiEnd() + image), 0);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
