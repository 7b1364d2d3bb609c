#include "image_file_info.h"

#include <gtest/gtest.h>

#include <istream>
#include <limits>

#include "memory_buffer.h"
#include "mrc_file.h"
#include "open_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::ByteOrder;
using Testing::BytesOf;
using Testing::MrcFile;

using Bytes = std::vector<std::uint8_t>;

constexpr SIZE kWholeSize = {1000, 1000};  // larger than all frames here, so that none is reduced
constexpr std::int32_t kMin = std::numeric_limits<std::int32_t>::min();
constexpr std::int32_t kMax = std::numeric_limits<std::int32_t>::max();

class OpenMrc : public Testing::OpenFile<MrcFileInfo> {
 public:
  explicit OpenMrc(const MrcFile& file, const std::wstring& extension = L"mrc") : OpenFile(file, extension) {}
};

bool IsValid(const MrcFile& file) {
  return OpenMrc(file)->IsValid();
}

TEST(Mrc, DescribesItsHeader) {
  MrcFile file;
  file.nx = 7;
  file.ny = 5;
  file.nz = 3;
  const OpenMrc mrc(file);
  ASSERT_TRUE(mrc->IsValid());
  EXPECT_EQ(mrc->GetDimensions(), (Size2{7, 5}));
  EXPECT_EQ(mrc->GetFrameCount(), 3);
  EXPECT_EQ(mrc->GetComment(), L"");
}

TEST(Mrc, HasTheTypeOfItsMode) {
  struct Row {
    std::int32_t mode, bits;
    const wchar_t* name;
  };
  constexpr Row kRows[] = {
      {0, 8, L"8 bit unsigned"},          {1, 16, L"16 bit signed"},        {2, 32, L"32 bit float"},
      {3, 32, L"32 bit complex integer"}, {4, 64, L"64 bit complex float"}, {5, 8, L"8 bit unsigned"},
      {6, 16, L"16 bit unsigned"},        {7, 8, L"8 bit unsigned"},        {8, 8, L"8 bit unsigned"},
      {9, 8, L"8 bit unsigned"},          {10, 8, L"8 bit unsigned"},       {11, 8, L"8 bit unsigned"},
      {12, 8, L"8 bit unsigned"},         {13, 8, L"8 bit unsigned"},       {14, 8, L"8 bit unsigned"},
      {15, 8, L"8 bit unsigned"},         {16, 24, L"24 bit RGB"},
  };
  for (const ByteOrder order : {ByteOrder::kLittleEndian, ByteOrder::kBigEndian}) {
    for (const Row& row : kRows) {
      SCOPED_TRACE(row.mode);
      MrcFile file;
      file.mode = row.mode;
      file.order = order;
      file.pixels = std::string(static_cast<std::size_t>(row.bits / 8), '\1');
      const OpenMrc mrc(file);
      ASSERT_TRUE(mrc->IsValid());
      EXPECT_EQ(mrc->GetBitDepth(), row.bits);
      EXPECT_EQ(mrc->GetDataTypeName(), row.name);
      EXPECT_EQ(mrc.Thumbnail({1, 1}).width, 1);
      file.pixels.pop_back();
      EXPECT_EQ(OpenMrc(file).Thumbnail({1, 1}).width, 0);
    }
  }
}

TEST(Mrc, RejectsModesOutside0To16) {
  for (const std::int32_t mode : {17, 101, kMax, -1, kMin}) {
    MrcFile file;
    file.mode = mode;
    EXPECT_FALSE(IsValid(file)) << mode;
  }
}

TEST(Mrc, RejectsEmptyStacks) {
  for (const auto field : {&MrcFile::nx, &MrcFile::ny, &MrcFile::nz}) {
    for (const std::int32_t number : {0, -1, kMin}) {
      MrcFile file;
      file.*field = number;
      EXPECT_FALSE(IsValid(file)) << number;
    }
  }
}

TEST(Mrc, RejectionSetsBadbit) {
  MrcFile file;
  file.mode = 17;
  OpenMrc mrc(file);
  EXPECT_TRUE(mrc.stream().bad());
}

TEST(Mrc, DescriptionsAreEmptyForEveryExtension) {
  for (const wchar_t* extension : {L"mrc", L"ali", L"ALI", L"rec", L"Rec", L""}) {
    EXPECT_EQ(OpenMrc(MrcFile(), extension)->GetTypeDescription(), L"");
  }
}

TEST(Mrc, BigEndianHeaderIsRecognisedByItsSize) {
  MrcFile file;
  file.order = ByteOrder::kBigEndian;
  file.nx = 512;
  file.ny = 300;
  file.nz = 40;
  file.mode = 6;
  file.labels = {"one", "two"};
  const OpenMrc mrc(file);
  ASSERT_TRUE(mrc->IsValid());
  EXPECT_EQ(mrc->GetDimensions(), (Size2{512, 300}));
  EXPECT_EQ(mrc->GetFrameCount(), 40);
  EXPECT_EQ(mrc->GetDataTypeName(), L"16 bit unsigned");
  EXPECT_EQ(mrc->GetComment(), L"one\r\ntwo");
}

TEST(Mrc, IsBigEndianOnlyIfBothEdgesAreTooLarge) {
  MrcFile file;
  file.nx = 65536;
  file.ny = 65535;
  EXPECT_EQ(OpenMrc(file)->GetDimensions(), (Size2{65536, 65535}));
  file.ny = 65536;  // in big-endian order both are 256
  EXPECT_EQ(OpenMrc(file)->GetDimensions(), (Size2{0x100, 0x100}));
  file.nz = 0x01000000;
  EXPECT_EQ(OpenMrc(file)->GetFrameCount(), 1);
  file.nx = kMin;  // too large as an unsigned number
  EXPECT_EQ(OpenMrc(file)->GetDimensions(), (Size2{0x80, 0x100}));
}

TEST(MrcComment, JoinsTheLabels) {
  MrcFile file;
  file.labels = {"first", "  second  ", "   ", "", "fifth"};
  EXPECT_EQ(OpenMrc(file)->GetComment(), L"first\r\n  second\r\nfifth");
}

TEST(MrcComment, BlankLabelsLeaveNoEmptyLines) {
  MrcFile file;
  file.labels = {" ", "text", std::string(80, ' ')};
  EXPECT_EQ(OpenMrc(file)->GetComment(), L"text");
}

TEST(MrcComment, LabelEndsAtItsFirstZero) {
  MrcFile file;
  file.labels = {std::string("before \0after", 13), std::string("\0after", 6)};
  EXPECT_EQ(OpenMrc(file)->GetComment(), L"before");
}

TEST(MrcComment, LabelCanFillItsField) {
  MrcFile file;
  file.labels = {std::string(80, 'a'), std::string(79, 'b') + ' '};
  EXPECT_EQ(OpenMrc(file)->GetComment(), std::wstring(80, L'a') + L"\r\n" + std::wstring(79, L'b'));
}

TEST(MrcComment, HasAtMostTenLabels) {
  MrcFile file;
  std::wstring all;
  for (char c = 'a'; c < 'a' + 10; ++c) {
    file.labels.emplace_back(1, c);
    all += (all.empty() ? L"" : L"\r\n") + std::wstring(1, static_cast<wchar_t>(c));
  }
  EXPECT_EQ(OpenMrc(file)->GetComment(), all);
  for (const std::int32_t count : {25, kMax}) {
    file.nlabl = count;
    EXPECT_EQ(OpenMrc(file)->GetComment(), all);
  }
  file.nlabl = 2;
  EXPECT_EQ(OpenMrc(file)->GetComment(), L"a\r\nb");
  for (const std::int32_t count : {0, -1, kMin}) {
    file.nlabl = count;
    EXPECT_EQ(OpenMrc(file)->GetComment(), L"");
  }
}

TEST(MrcComment, NumberOfLabelsHasTheByteOrderOfTheHeader) {
  MrcFile file{.nx = 2, .ny = 2, .order = ByteOrder::kBigEndian};
  file.labels = {"used", "not used"};
  file.nlabl = 1;
  EXPECT_EQ(OpenMrc(file)->GetComment(), L"used");
}

TEST(MrcComment, WidensBytesWithTheirSign) {
  MrcFile file;
  file.labels = {"5 \xB5m"};
  EXPECT_EQ(OpenMrc(file)->GetComment(), (std::wstring{L'5', L' ', wchar_t{0xFFB5}, L'm'}));
}

/// Returns a stack whose sections are one column: 255 at the bottom, the section's number, and 0 at the top.
MrcFile Stack(std::int32_t sections) {
  MrcFile file;
  file.ny = 3;
  file.nz = sections;
  for (std::int32_t i = 0; i < sections; ++i) {
    file.pixels += BytesOf<std::uint8_t>({255, static_cast<std::uint8_t>(i), 0});
  }
  return file;
}

TEST(MrcThumbnail, ShowsTheMiddleSectionWithItsFirstRowAtTheBottom) {
  for (std::int32_t sections = 1; sections <= 7; ++sections) {
    const auto middle = static_cast<std::uint8_t>(sections / 2);
    EXPECT_EQ(OpenMrc(Stack(sections)).Thumbnail(kWholeSize).bytes, (Bytes{0, middle, 255})) << sections;
  }
}

TEST(MrcThumbnail, CanBeRequestedAgain) {
  const OpenMrc mrc(Stack(5));
  EXPECT_EQ(mrc.Thumbnail(kWholeSize).bytes, (Bytes{0, 2, 255}));
  EXPECT_EQ(mrc.Thumbnail({1, 1}).width, 0);  // not one whole block
  EXPECT_EQ(mrc.Thumbnail(kWholeSize).bytes, (Bytes{0, 2, 255}));
}

TEST(MrcThumbnail, NeedsOnlyItsSection) {
  MrcFile file = Stack(5);
  file.pixels.resize(3 * 3);
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 2, 255}));
  file.pixels.resize(3 * 3 - 1);
  EXPECT_TRUE(IsValid(file));
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).width, 0);
}

TEST(MrcThumbnail, PixelsFollowTheExtendedHeader) {
  MrcFile file = Stack(1);
  file.extendedHeader = std::string(4096, 'x');
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 0, 255}));
  // A length of -1024 leads to the beginning of the header, any smaller one before the file.
  file.next = -1024;
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).width, 1);
  file.next = -1025;
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).width, 0);
  file.next = kMax;  // the position wraps to a negative number
  EXPECT_EQ(OpenMrc(file).Thumbnail(kWholeSize).width, 0);
}

TEST(MrcThumbnail, OnlySixteenBitPixelsAreSwapped) {
  const auto thumbnail = [](std::int32_t mode, ByteOrder header, std::string pixels) {
    MrcFile file;
    file.order = header;
    file.nx = 3;
    file.mode = mode;
    file.pixels = std::move(pixels);
    return OpenMrc(file).Thumbnail({3, 1}).bytes;
  };
  constexpr ByteOrder kLittle = ByteOrder::kLittleEndian;
  constexpr ByteOrder kBig = ByteOrder::kBigEndian;
  for (const std::int32_t mode : {1, 6}) {
    EXPECT_EQ(thumbnail(mode, kBig, BytesOf<std::int16_t>({0, 1, 255}, kBig)), (Bytes{0, 1, 255}));
    EXPECT_EQ(thumbnail(mode, kBig, BytesOf<std::int16_t>({0, 1, 256}, kLittle)), (Bytes{0, 255, 0}));
    EXPECT_EQ(thumbnail(mode, kLittle, BytesOf<std::int16_t>({0, 1, 255}, kLittle)), (Bytes{0, 1, 255}));
  }
  // All other types are never swapped, whatever the header's order.
  EXPECT_EQ(thumbnail(0, kBig, BytesOf<std::uint8_t>({0, 1, 255})), (Bytes{0, 1, 255}));
  EXPECT_EQ(thumbnail(2, kBig, BytesOf<float>({0, 1, 255})), (Bytes{0, 1, 255}));
  EXPECT_EQ(thumbnail(3, kBig, BytesOf<std::int16_t>({1, 0, 3, 0, 9, 0})), (Bytes{0, 127, 255}));
  EXPECT_EQ(thumbnail(4, kBig, BytesOf<float>({1, 0, 3, 0, 9, 0})), (Bytes{0, 127, 255}));
  EXPECT_EQ(thumbnail(16, kBig, BytesOf<std::uint8_t>({1, 2, 3, 4, 5, 6, 7, 8, 9})),
            (Bytes{3, 2, 1, 6, 5, 4, 9, 8, 7}));
}

/// A file of `sections` sections of 64 KiB, and its reader. The first section is a ramp, the others are 0.
struct SparseStack {
  static constexpr std::int64_t kSectionBytes = 0x10000;

  static std::string Head(std::int32_t sections) {
    MrcFile file;
    file.nx = 256;
    file.ny = 256;
    file.nz = sections;
    for (std::int64_t i = 0; i < kSectionBytes; ++i) file.pixels += static_cast<char>(i);
    return file.Bytes();
  }

  explicit SparseStack(std::int32_t sections) : head(Head(sections)) {
    buffer.trailingZeros = (sections - 1) * kSectionBytes;
  }

  Testing::BitmapPixels Thumbnail() const { return Testing::TakeBitmap(reader.CreateThumbnail({256, 256})); }

  std::string head;
  Testing::MemoryBuffer buffer{head};
  std::istream stream{&buffer};
  MrcFileInfo reader{stream, L"mrc"};
};

TEST(MrcThumbnail, SectionFarIntoAStackCostsNoMoreThanTheFirst) {
  for (const std::int32_t sections : {1, 1000, 30000}) {
    const SparseStack stack(sections);
    EXPECT_EQ(stack.Thumbnail().width, 256);
    EXPECT_EQ(stack.buffer.bytesRead, 1024 + SparseStack::kSectionBytes) << sections;
    EXPECT_EQ(stack.buffer.reads, 2);
  }
}

TEST(MrcThumbnail, SectionFrom2GiBOnIsNotReached) {
  EXPECT_EQ(SparseStack(2 * 0x7FFF).Thumbnail().width, 256);  // begins 64 KiB before 2 GiB
  const SparseStack beyond(2 * 0x8000);                       // begins at 2 GiB, which is negative in 32 bits
  EXPECT_TRUE(beyond.reader.IsValid());
  EXPECT_EQ(beyond.Thumbnail().width, 0);
  EXPECT_TRUE(beyond.stream.fail());
  EXPECT_EQ(beyond.buffer.bytesRead, 1024);
}

TEST(MrcThumbnail, PositionOfASectionWrapsAt32Bits) {
  // The middle section should begin at 4 GiB, which wraps to the position of the first section.
  const auto first = SparseStack(1).Thumbnail();
  EXPECT_EQ(SparseStack(2 * 0x10000).Thumbnail(), first);
  EXPECT_NE(SparseStack(2 * 0x10001).Thumbnail(), first);
}

TEST(MrcThumbnail, SectionWhoseSizeWrapsHasNone) {
  const auto width = [](std::int32_t mode, std::int32_t nx, std::int32_t ny) {
    const MrcFile file{.nx = nx, .ny = ny, .mode = mode, .pixels = std::string(256, 'x')};
    const OpenMrc mrc(file);
    const int result = mrc.Thumbnail({256, 256}).width;
    EXPECT_EQ(mrc->IsValid(), result > 0);  // the failed read makes the reader invalid
    return result;
  };
  EXPECT_EQ(width(0, 1, 256), 1);
  EXPECT_EQ(width(0, 0x1000001, 256), 0);  // 2^32 + 256 pixels
  EXPECT_EQ(width(2, 0x1000001, 64), 0);   // 2^30 + 64 pixels, 2^32 + 256 bytes
}

TEST(MrcThumbnail, SectionWhoseSizeWrapsHasNoneAlthoughItsBytesExist) {
  const std::string head = MrcFile{.nx = 0x1000001, .ny = 256}.Bytes();
  Testing::MemoryBuffer buffer(head);
  buffer.trailingZeros = std::int64_t{6} << 30;
  std::istream stream(&buffer);
  const MrcFileInfo mrc(stream, L"mrc");
  EXPECT_TRUE(mrc.IsValid());
  EXPECT_EQ(Testing::TakeBitmap(mrc.CreateThumbnail({256, 256})).width, 0);
  EXPECT_EQ(buffer.bytesRead, 1024);
}

TEST(MrcThumbnail, PositionAfterALongExtendedHeaderWraps) {
  // Extended header and section are each less than 2 GiB, and together more.
  MrcFile file{.nx = 1000, .ny = 1000, .nz = 2};
  file.next = kMax - 1024;
  const std::string head = file.Bytes();
  Testing::MemoryBuffer buffer(head);
  buffer.trailingZeros = std::int64_t{6} << 30;
  std::istream stream(&buffer);
  EXPECT_EQ(Testing::TakeBitmap(MrcFileInfo(stream, L"mrc").CreateThumbnail({256, 256})).width, 0);
  EXPECT_EQ(buffer.bytesRead, 1024);
}

TEST(MrcThumbnail, HugeSectionsHaveNone) {
  MrcFile file = Stack(1);
  for (const std::int32_t mode : {0, 1, 2, 3, 4, 6, 16}) {
    file.mode = mode;
    for (const Size2 size :
         {Size2{65536, 65535}, Size2{kMax, 65535}, Size2{kMax, 1}, Size2{1, kMax}, Size2{65535, 65535}}) {
      file.nx = size.width;
      file.ny = size.height;
      file.nz = kMax;
      EXPECT_TRUE(IsValid(file));
      EXPECT_EQ(OpenMrc(file).Thumbnail({256, 256}).width, 0);
    }
  }
}

TEST(MrcThumbnail, SectionsWhoseBytesExceed64BitsHaveNone) {
  // Both edges can be this large only in a swapped header.
  const MrcFile file{.nx = kMax, .ny = kMax, .mode = 4, .order = ByteOrder::kBigEndian, .pixels = "x"};
  EXPECT_TRUE(IsValid(file));
  EXPECT_EQ(OpenMrc(file).Thumbnail({256, 256}).width, 0);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
