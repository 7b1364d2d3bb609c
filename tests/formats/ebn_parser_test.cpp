#include "image_file_info.h"

#include <gtest/gtest.h>

#include <limits>
#include <locale>

#include "ebn_file.h"
#include "memory_buffer.h"
#include "open_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BytesOf;
using Testing::EbnFile;

using OpenEbn = Testing::OpenFile<EbnFileInfo>;

constexpr SIZE kWholeSize = {1000, 1000};  // larger than all frames here, so that none is reduced

using Bytes = std::vector<std::uint8_t>;

std::wstring CommentOf(const EbnFile& file) {
  const OpenEbn ebn(file);
  EXPECT_TRUE(ebn->IsValid());
  return ebn->GetComment();
}

TEST(Ebn, HasTheTypeOfItsCode) {
  struct Row {
    std::int32_t bits;
    const wchar_t* name;
  };
  constexpr Row kRows[] = {
      {8, L"8 bit unsigned"}, {16, L"16 bit unsigned"}, {32, L"32 bit unsigned"}, {8, L"8 bit signed"},
      {16, L"16 bit signed"}, {32, L"32 bit signed"},   {32, L"32 bit float"},    {64, L"64 bit float"},
  };
  EbnFile file;
  for (std::uint16_t code = 1; code <= 8; ++code) {
    file.typeCode = code;
    const OpenEbn ebn(file);
    EXPECT_TRUE(ebn->IsValid());
    EXPECT_EQ(ebn->GetBitDepth(), kRows[code - 1].bits);
    EXPECT_EQ(ebn->GetDataTypeName(), kRows[code - 1].name);
  }
  for (const std::uint16_t code :
       std::initializer_list<std::uint16_t>{0, 9, 10, 11, 0x0101, 0x8001, 0xFFFF}) {
    file.typeCode = code;
    EXPECT_FALSE(OpenEbn(file)->IsValid()) << code;
  }
}

TEST(Ebn, RejectsEmptyFrames) {
  for (const std::int32_t size : {0, -1, std::numeric_limits<std::int32_t>::min()}) {
    EbnFile file;
    file.width = size;
    EXPECT_FALSE(OpenEbn(file)->IsValid());
    std::swap(file.width, file.height);
    EXPECT_FALSE(OpenEbn(file)->IsValid());
  }
}

TEST(Ebn, RejectsPixelsInsideTheHeader) {
  EbnFile file;
  for (const std::int32_t offset : {std::numeric_limits<std::int32_t>::min(), -1, 0, 53}) {
    file.dataOffset = offset;
    EXPECT_FALSE(OpenEbn(file)->IsValid()) << offset;
  }
  file.dataOffset = 54;
  EXPECT_TRUE(OpenEbn(file)->IsValid());
}

TEST(Ebn, DescribesItsOneFrame) {
  EbnFile file;
  file.width = 3;
  file.height = 2;
  file.afterHeader = std::string(1000, '\0');
  const OpenEbn ebn(file);
  EXPECT_EQ(ebn->GetDimensions(), (Size2{3, 2}));
  EXPECT_EQ(ebn->GetFrameCount(), 1);
  EXPECT_EQ(ebn->GetTypeDescription(), L"");
}

TEST(Ebn, PixelsBeginAtTheirOffset) {
  EbnFile file;
  file.width = 3;
  file.height = 2;
  file.afterHeader = BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255});
  EXPECT_EQ(OpenEbn(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
  file.dataOffset = 58;
  EXPECT_EQ(OpenEbn(file).Thumbnail(kWholeSize).width, 0);
  file.afterHeader = "****" + file.afterHeader;
  EXPECT_EQ(OpenEbn(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Ebn, HugeFramesHaveNoThumbnail) {
  constexpr std::int32_t kMax = std::numeric_limits<std::int32_t>::max();
  EbnFile file;
  file.typeCode = 8;
  file.afterHeader = std::string(64, '\0');
  for (const Size2 size : {Size2{kMax, kMax}, Size2{0x10000, 0x10000}, Size2{0x8000, 0x10001}}) {
    file.width = size.width;
    file.height = size.height;
    EXPECT_TRUE(OpenEbn(file)->IsValid());
    EXPECT_EQ(OpenEbn(file)->GetDimensions(), size);
    EXPECT_EQ(OpenEbn(file).Thumbnail({256, 256}).width, 0);
  }
}

TEST(Ebn, FrameWhosePixelCountWrapsHasNoThumbnailAlthoughItsBytesExist) {
  EbnFile file;
  file.width = 0x10000;
  file.height = 0x10001;
  const std::string head = file.Bytes();
  Testing::MemoryBuffer buffer(head);
  buffer.trailingZeros = std::int64_t{6} << 30;
  std::istream stream(&buffer);
  const EbnFileInfo ebn(stream);
  EXPECT_TRUE(ebn.IsValid());
  EXPECT_EQ(Testing::TakeBitmap(ebn.CreateThumbnail({256, 256})).width, 0);
  EXPECT_EQ(buffer.bytesRead, static_cast<std::int64_t>(head.size()));
}

TEST(EbnComment, NamesTheMicroscope) {
  EbnFile file;
  file.model = 1.0;
  file.source = 1.0;
  file.lens = -1.0;
  file.kilovolts = 200.0;
  EXPECT_EQ(CommentOf(file), L"Halden 20 FEG 200.0 kV");
  file.lens = -1.6;
  EXPECT_EQ(CommentOf(file), L"Halden 20 FEG POLE 200.0 kV");
  file.dNumber = 12.0;
  EXPECT_EQ(CommentOf(file), L"Halden 20 FEG POLE D12 200.0 kV");
}

TEST(EbnComment, AlwaysHasTheVoltage) {
  EXPECT_EQ(CommentOf({}), L" 0.0 kV");
}

/// Returns what the comment has before the voltage when `field` holds `stored`. A code n is stored as n; a
/// code -n is stored as -(n + 0.5) or a little less.
std::wstring TextOf(double EbnFile::* field, double stored) {
  EbnFile file;
  file.*field = stored;
  const std::wstring comment = CommentOf(file);
  const std::wstring voltage = L" 0.0 kV";
  EXPECT_TRUE(comment.ends_with(voltage));
  return comment.substr(0, comment.size() - voltage.size());
}

TEST(EbnComment, HasATextForEveryCode) {
  struct Row {
    double EbnFile::* field;
    int code;
    const wchar_t* text;
  };
  constexpr Row kRows[] = {
      {&EbnFile::model, -3, L""},
      {&EbnFile::model, -2, L"Halden 10"},
      {&EbnFile::model, -1, L"Halden 12"},
      {&EbnFile::model, 0, L""},
      {&EbnFile::model, 1, L"Halden 20"},
      {&EbnFile::model, 2, L"Halden 30"},
      {&EbnFile::model, 3, L""},
      {&EbnFile::source, -3, L""},
      {&EbnFile::source, -2, L" W"},
      {&EbnFile::source, -1, L" Lab6"},
      {&EbnFile::source, 0, L""},
      {&EbnFile::source, 1, L" FEG"},
      {&EbnFile::source, 2, L""},
      {&EbnFile::lens, -4, L""},
      {&EbnFile::lens, -3, L" HC"},
      {&EbnFile::lens, -2, L" BioPOLE"},
      {&EbnFile::lens, -1, L" POLE"},
      {&EbnFile::lens, 0, L""},
      {&EbnFile::lens, 1, L" SPOLE"},
      {&EbnFile::lens, 2, L" UPOLE"},
      {&EbnFile::lens, 3, L" XPOLE"},
      {&EbnFile::lens, 4, L" CryoPOLE"},
      {&EbnFile::lens, 5, L""},
      {&EbnFile::dNumber, 0, L""},
      {&EbnFile::dNumber, 1, L" D1"},
      {&EbnFile::dNumber, -1, L" D-1"},
  };
  for (const Row& row : kRows) {
    const double stored = row.code < 0 ? row.code - 0.5 : row.code;
    EXPECT_EQ(TextOf(row.field, stored), row.text) << row.code;
  }
}

TEST(EbnComment, CodesAreTruncatedAfterAddingHalf) {
  EXPECT_EQ(TextOf(&EbnFile::model, 2.4), L"Halden 30");
  EXPECT_EQ(TextOf(&EbnFile::model, 2.5), L"");
  EXPECT_EQ(TextOf(&EbnFile::model, 1.5), L"Halden 30");
  EXPECT_EQ(TextOf(&EbnFile::model, 0.4), L"");
  // Below 0, adding a half and truncating does not give the nearest integer.
  EXPECT_EQ(TextOf(&EbnFile::model, -1.0), L"");
  EXPECT_EQ(TextOf(&EbnFile::model, -1.49), L"");
  EXPECT_EQ(TextOf(&EbnFile::model, -1.5), L"Halden 12");
  EXPECT_EQ(TextOf(&EbnFile::model, -2.0), L"Halden 12");
  EXPECT_EQ(TextOf(&EbnFile::model, -2.49), L"Halden 12");
  EXPECT_EQ(TextOf(&EbnFile::model, -2.5), L"Halden 10");
  EXPECT_EQ(TextOf(&EbnFile::model, -3.49), L"Halden 10");
  EXPECT_EQ(TextOf(&EbnFile::model, -3.5), L"");
  EXPECT_EQ(TextOf(&EbnFile::dNumber, 0.4), L"");
  EXPECT_EQ(TextOf(&EbnFile::dNumber, 0.5), L" D1");
}

TEST(EbnComment, UnknownCodesAddNothing) {
  using Limits = std::numeric_limits<double>;
  for (const double stored : {Limits::quiet_NaN(), Limits::infinity(), -Limits::infinity(), Limits::max(),
                              Limits::lowest(), 2147483647.5, -2147483649.5, 4294967297.0}) {
    for (const auto field : {&EbnFile::model, &EbnFile::source, &EbnFile::lens}) {
      EXPECT_EQ(TextOf(field, stored), L"") << stored;
    }
  }
}

TEST(EbnComment, EveryFiniteDNumberHasAllItsDigits) {
  using Limits = std::numeric_limits<double>;
  const auto text = [](double stored) { return TextOf(&EbnFile::dNumber, stored); };
  EXPECT_EQ(text(2147483647), L" D2147483647");
  EXPECT_EQ(text(3e9), L" D3000000000");
  EXPECT_EQ(text(-3e9), L" D-2999999999");
  EXPECT_EQ(text(1e15), L" D1000000000000000");
  EXPECT_EQ(text(1e22), L" D10000000000000000000000");
  EXPECT_EQ(text(Limits::max()).size(), 2 + 309u);
  EXPECT_EQ(text(Limits::lowest()).size(), 2 + 1 + 309u);
  EXPECT_TRUE(text(Limits::lowest()).starts_with(L" D-17976931348623157"));
  EXPECT_EQ(text(-0.9), L"");
  for (const double none : {Limits::quiet_NaN(), Limits::infinity(), -Limits::infinity()}) {
    EXPECT_EQ(text(none), L"") << none;
  }
}

TEST(EbnComment, VoltageHasOneDecimal) {
  const auto voltage = [](double kilovolts) {
    EbnFile file;
    file.kilovolts = kilovolts;
    return CommentOf(file);
  };
  EXPECT_EQ(voltage(300), L" 300.0 kV");
  EXPECT_EQ(voltage(119.96), L" 120.0 kV");
  EXPECT_EQ(voltage(0.05), L" 0.1 kV");  // the double is a little above 0.05
  EXPECT_EQ(voltage(0.25), L" 0.2 kV");  // ties round to even
  EXPECT_EQ(voltage(-0.04), L" -0.0 kV");
  EXPECT_EQ(voltage(-60), L" -60.0 kV");
  EXPECT_EQ(voltage(1e22), L" 10000000000000000000000.0 kV");
  EXPECT_EQ(voltage(std::numeric_limits<double>::quiet_NaN()), L" nan kV");
  EXPECT_EQ(voltage(-std::numeric_limits<double>::infinity()), L" -inf kV");
  const std::wstring huge = voltage(std::numeric_limits<double>::lowest());
  EXPECT_EQ(huge.size(), 1 + 1 + 309 + 2 + 3u);
  EXPECT_TRUE(huge.starts_with(L" -17976931348623157"));
  EXPECT_TRUE(huge.ends_with(L".0 kV"));
}

TEST(EbnComment, DoesNotFollowTheLocaleOfTheHost) {
  struct CommaForPoint : std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
  };
  const std::locale before = std::locale::global(std::locale(std::locale::classic(), new CommaForPoint));
  EXPECT_EQ(CommentOf({}), L" 0.0 kV");
  std::locale::global(before);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
