#include "image_file_info.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>

#include "memory_buffer.h"
#include "open_file.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BytesOf;
using Testing::PackedRawFile;
using Testing::RawFile;

using OpenRaw = Testing::OpenFile<RawFileInfo>;

constexpr SIZE kWholeSize = {1000, 1000};  // larger than all frames here, so that none is reduced

using Bytes = std::vector<std::uint8_t>;

TEST(Raw, HasTheTypeOfItsClassAndBits) {
  struct Row {
    std::int32_t valueClass, bits;
    const wchar_t* name;
  };
  constexpr Row kRows[] = {
      {0, 8, L"8 bit unsigned"}, {0, 16, L"16 bit unsigned"},       {0, 32, L"32 bit unsigned"},
      {1, 8, L"8 bit signed"},   {1, 16, L"16 bit signed"},         {1, 32, L"32 bit signed"},
      {2, 32, L"32 bit float"},  {2, 64, L"64 bit float"},          {3, 24, L"24 bit RGB"},
      {5, 24, L"24 bit BGR"},    {10, 64, L"64 bit complex float"}, {10, 128, L"128 bit complex float"},
  };
  for (std::int32_t valueClass = -1; valueClass <= 17; ++valueClass) {
    for (const std::int32_t bits : {-8, 0, 1, 7, 8, 12, 16, 24, 32, 48, 64, 128, 256}) {
      SCOPED_TRACE(testing::Message() << "class " << valueClass << ", " << bits << " bits");
      const auto* const row = std::ranges::find_if(kRows, [&](const Row& candidate) {
        return candidate.valueClass == valueClass && candidate.bits == bits;
      });
      RawFile file;
      file.valueClass = valueClass;
      file.bitsPerPixel = bits;
      const OpenRaw raw(file);
      ASSERT_EQ(raw->IsValid(), row != std::end(kRows));
      if (row == std::end(kRows)) continue;
      EXPECT_EQ(raw->GetBitDepth(), bits);
      EXPECT_EQ(raw->GetDataTypeName(), row->name);
    }
  }
}

TEST(Raw, CombinesClassAndBitsIn32Bits) {
  RawFile file;
  file.bitsPerPixel = 0x10008;
  EXPECT_EQ(OpenRaw(file)->GetDataTypeName(), L"8 bit signed");
  EXPECT_TRUE(OpenRaw(file)->IsValid());
  // Each pixel should have 8193 bytes, more than the file has.
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);

  file.bitsPerPixel = 8 - 0x10000;
  file.valueClass = 2;
  file.pixels = "1";
  EXPECT_EQ(OpenRaw(file)->GetDataTypeName(), L"8 bit signed");
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);

  file.bitsPerPixel = 8;
  file.valueClass = 0x10000;
  EXPECT_EQ(OpenRaw(file)->GetDataTypeName(), L"8 bit unsigned");
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 1);
}

TEST(Raw, RejectsAnotherMagic) {
  RawFile file;
  EXPECT_TRUE(OpenRaw(file)->IsValid());
  for (std::size_t i = 0; i < file.magic.size(); ++i) {
    RawFile other;
    other.magic[i] = static_cast<char>(other.magic[i] ^ 0x20);
    EXPECT_FALSE(OpenRaw(other)->IsValid()) << "byte " << i;
  }
  file.magic[11] = '\0';  // a string of 11 characters
  EXPECT_FALSE(OpenRaw(file)->IsValid());
}

TEST(Raw, RejectsWordsOneAndFourOtherThanOne) {
  for (const std::int32_t word1 : {0, 1, 2, -1}) {
    for (const std::int32_t word4 : {0, 1, 2, -1}) {
      RawFile file;
      file.word1 = word1;
      file.word4 = word4;
      EXPECT_EQ(OpenRaw(file)->IsValid(), word1 == 1 && word4 == 1) << word1 << ", " << word4;
    }
  }
}

TEST(Raw, RejectionSetsBadbit) {
  RawFile file;
  file.word1 = 2;
  OpenRaw raw(file);
  EXPECT_TRUE(raw.stream().bad());
}

TEST(Raw, HasOneFrameAndNoComment) {
  const OpenRaw raw(PackedRawFile(DataType::kUInt8, 7, 5, {}));
  EXPECT_EQ(raw->GetDimensions(), (Size2{7, 5}));
  EXPECT_EQ(raw->GetFrameCount(), 1);
  EXPECT_EQ(raw->GetComment(), L"");
  EXPECT_EQ(raw->GetTypeDescription(), L"");
}

TEST(Raw, AcceptsAnySize) {
  for (const std::int32_t size : {0, -1, std::numeric_limits<std::int32_t>::min()}) {
    RawFile file = PackedRawFile(DataType::kUInt8, 2, 2, "0123");
    file.width = size;
    EXPECT_TRUE(OpenRaw(file)->IsValid());
    EXPECT_EQ(OpenRaw(file)->GetDimensions(), (Size2{size, 2}));
    EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
    std::swap(file.width, file.height);
    EXPECT_TRUE(OpenRaw(file)->IsValid());
    EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
  }
}

TEST(Raw, AColourFrameWithoutPixelsDoesNotEndTheProcess) {
  for (const DataType type : {DataType::kRgb24, DataType::kBgr24}) {
    for (const Size2 size : {Size2{0, 0}, Size2{0, 2}, Size2{2, 0}, Size2{-2, 2}, Size2{-2, -2}}) {
      RawFile file = PackedRawFile(type, 2, 2, std::string(12, 'x'));
      file.width = size.width;
      file.height = size.height;
      const OpenRaw raw(file);
      EXPECT_EQ(raw.Thumbnail(kWholeSize).width, 0);
      EXPECT_TRUE(raw->IsValid());
    }
  }
}

TEST(Raw, PixelsFollowTheHeader) {
  const OpenRaw raw(PackedRawFile(DataType::kUInt8, 3, 2, BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255})));
  EXPECT_EQ(raw.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));
}

TEST(Raw, BottomUpFileShowsTheSamePictureAsTopDown) {
  RawFile file = PackedRawFile(DataType::kUInt16, 2, 3, BytesOf<std::uint16_t>({4, 255, 2, 3, 0, 1}));
  file.offset = (3 - 1) * 2 * 2;
  file.rowStride = -2 * 2;
  const OpenRaw bottomUp(file);
  EXPECT_EQ(bottomUp.Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));

  // It needs exactly as many bytes as the packed picture.
  file.pixels.pop_back();
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
}

TEST(Raw, ReadsEveryThirdByte) {
  RawFile file = PackedRawFile(DataType::kUInt8, 3, 2,
                               BytesOf<std::uint8_t>({9, 0, 9, 9, 1, 9, 9, 2, 9, 9,  //
                                                      3, 9, 9, 4, 9, 9, 255}));
  file.offset = 1;
  file.pixelStride = 3;
  file.rowStride = 9;
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 1, 2, 3, 4, 255}));

  // The block ends with the last pixel: offset + 2 * 3 + 1 * 9 + 1 bytes.
  ASSERT_EQ(file.pixels.size(), 17u);
  file.pixels.pop_back();
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
}

TEST(Raw, ReadsMirroredAndTransposedPictures) {
  RawFile file = PackedRawFile(DataType::kUInt8, 3, 2, BytesOf<std::uint8_t>({0, 1, 2, 3, 4, 255}));
  file.offset = 5;
  file.pixelStride = -1;
  file.rowStride = -3;
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).bytes, (Bytes{255, 4, 3, 2, 1, 0}));

  file.offset = 0;
  file.pixelStride = 2;
  file.rowStride = 1;
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 2, 4, 1, 3, 255}));
}

TEST(Raw, ReadsOverlappingPixels) {
  RawFile file = PackedRawFile(DataType::kUInt8, 2, 2, BytesOf<std::uint8_t>({0, 7, 255}));
  file.rowStride = 1;
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).bytes, (Bytes{0, 7, 7, 255}));
}

TEST(Raw, PixelBeforeTheBlockCannotBeRead) {
  RawFile file = PackedRawFile(DataType::kUInt8, 2, 2, "0123");
  file.offset = -1;
  EXPECT_TRUE(OpenRaw(file)->IsValid());
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
  file.offset = 0;
  file.rowStride = -2;
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
}

TEST(Raw, MissingPixelsFailTheFile) {
  const auto isValidAfterwards = [](const RawFile& file) {
    const OpenRaw raw(file);
    EXPECT_EQ(raw.Thumbnail(kWholeSize).width, 0);
    return raw->IsValid();
  };
  RawFile file = PackedRawFile(DataType::kUInt8, 2, 2, "0123");
  file.offset = -1;  // before the block
  EXPECT_FALSE(isValidAfterwards(file));
  file.offset = 1;  // beyond the file
  EXPECT_FALSE(isValidAfterwards(file));
  file.offset = 0;
  file.pixelStride = file.rowStride = 0;
  file.width = file.height = 10'000;  // too many pixels for four bytes
  EXPECT_FALSE(isValidAfterwards(file));
}

TEST(Raw, BlockWhoseSizeWrapsCannotBeRead) {
  // (width - 1) * pixelStride is 2^32, which wraps to 0 in the size of the block.
  RawFile file = PackedRawFile(DataType::kUInt8, 0x10001, 1, std::string(0x10001, '0'));
  file.pixelStride = 0x10000;
  EXPECT_TRUE(OpenRaw(file)->IsValid());
  EXPECT_EQ(OpenRaw(file).Thumbnail({0x10001, 1}).width, 0);
}

TEST(Raw, BlockWhoseSizeWrapsCannotBeReadAlthoughItsBytesExist) {
  struct Row {
    std::int32_t width, height, offset, pixelStride, rowStride;
  };
  constexpr std::int32_t kMax = std::numeric_limits<std::int32_t>::max();
  constexpr Row kRows[] = {
      {0x10001, 1, 0, 0x10000, 0},        // wraps along a row
      {1, 0x10001, 0, 0, 0x10000},        // wraps along a column
      {2, 1, 0x40000000, 0x40000000, 0},  // wraps with the offset
      {1, 2, 0x40000000, 0, 0x40000000},  //
      {2, 2, 0, 0x40000000, 0x40000000},  // wraps with both strides
      {1, 1, kMax, 0, 0},                 // wraps with the bytes of the pixel
  };
  for (const Row& row : kRows) {
    RawFile file = PackedRawFile(DataType::kUInt8, row.width, row.height, "");
    file.offset = row.offset;
    file.pixelStride = row.pixelStride;
    file.rowStride = row.rowStride;
    const std::string head = file.Bytes();
    Testing::MemoryBuffer buffer(head);
    buffer.trailingZeros = std::int64_t{6} << 30;
    std::istream stream(&buffer);
    const RawFileInfo raw(stream);
    EXPECT_TRUE(raw.IsValid());
    EXPECT_EQ(Testing::TakeBitmap(raw.CreateThumbnail({row.width, row.height})).width, 0) << &row - kRows;
    EXPECT_EQ(buffer.bytesRead, 49);
  }
}

/// Returns whether all 8-bit pixels are inside the block, in arithmetic that cannot wrap.
bool Fits(const RawFile& file) {
  if (file.width < 1 || file.height < 1) return false;
  for (const double right : {0.0, (file.width - 1.0) * file.pixelStride}) {
    for (const double down : {0.0, (file.height - 1.0) * file.rowStride}) {
      const double position = file.offset + right + down;
      if (position < 0 || position >= static_cast<double>(file.pixels.size())) return false;
    }
  }
  return true;
}

TEST(Raw, ExtremeNumbersAreReadOnlyIfAllPixelsExist) {
  using Limits = std::numeric_limits<std::int32_t>;
  constexpr std::int32_t kNumbers[] = {Limits::min(), Limits::min() + 1, -0x10000,     -1, 0, 1, 2,
                                       0x10000,       Limits::max() - 1, Limits::max()};
  RawFile file;
  file.pixels = "0123";
  for (const std::int32_t width : {Limits::min(), 0, 1, 2, 0x10001, Limits::max()}) {
    for (const std::int32_t height : {Limits::min(), 0, 1, 2, 0x10001, Limits::max()}) {
      // A frame with so many overlapping pixels is refused.
      const bool tooMany = std::int64_t{width} * height > (1 << 26) + 4;
      for (file.offset = -1; file.offset <= 3; ++file.offset) {
        for (const std::int32_t pixelStride : kNumbers) {
          for (const std::int32_t rowStride : kNumbers) {
            file.width = width;
            file.height = height;
            file.pixelStride = pixelStride;
            file.rowStride = rowStride;
            const OpenRaw raw(file);
            ASSERT_TRUE(raw->IsValid());
            const bool shown = raw.Thumbnail({Limits::max(), Limits::max()}).width > 0;
            ASSERT_EQ(shown, Fits(file) && !tooMany)
                << width << ", " << height << ", " << file.offset << ", " << pixelStride << ", " << rowStride;
          }
        }
      }
    }
  }
}

TEST(Raw, ShortPictureHasNoThumbnail) {
  RawFile file = PackedRawFile(DataType::kFloat32, 2, 2, std::string(15, '\0'));
  EXPECT_TRUE(OpenRaw(file)->IsValid());
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 0);
  file.pixels += '\0';
  EXPECT_EQ(OpenRaw(file).Thumbnail(kWholeSize).width, 2);
}

TEST(Raw, ThumbnailsCanBeRequestedAgain) {
  const OpenRaw raw(PackedRawFile(DataType::kUInt8, 2, 1, BytesOf<std::uint8_t>({0, 255})));
  EXPECT_EQ(raw.Thumbnail(kWholeSize).bytes, (Bytes{0, 255}));
  EXPECT_EQ(raw.Thumbnail({1, 1}).width, 0);  // not one whole block
  EXPECT_EQ(raw.Thumbnail(kWholeSize).bytes, (Bytes{0, 255}));
}

TEST(Raw, ColoursKeepTheirOrder) {
  const std::string pixels = BytesOf<std::uint8_t>({200, 100, 50});
  const OpenRaw rgb(PackedRawFile(DataType::kRgb24, 1, 1, pixels));
  EXPECT_EQ(rgb.Thumbnail({1, 1}).bytes, (Bytes{50, 100, 200}));
  const OpenRaw bgr(PackedRawFile(DataType::kBgr24, 1, 1, pixels));
  EXPECT_EQ(bgr.Thumbnail({1, 1}).bytes, (Bytes{200, 100, 50}));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
