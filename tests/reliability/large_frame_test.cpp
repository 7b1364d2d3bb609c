// Tests that the memory for a thumbnail does not grow with the frame.
#include <gtest/gtest.h>

#include <algorithm>
#include <istream>
#include <string>

#include "allocation_meter.h"
#include "bitmap_pixels.h"
#include "data_type.h"
#include "file_type_factory.h"
#include "frame_reader.h"
#include "memory_buffer.h"
#include "mrc_file.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::int32_t kEdge = 4096;
constexpr std::int64_t kFrameBytes = std::int64_t{kEdge} * kEdge * 4;

/// Returns the most memory in use, in bytes, while the thumbnail is made of a file that consists of `head`
/// and a frame of zeros.
std::int64_t PeakOfThumbnail(const std::string& head, const std::wstring& extension) {
  Testing::MemoryBuffer buffer(head);
  buffer.trailingZeros = kFrameBytes;
  std::istream stream(&buffer);
  const Testing::HeapMeter meter;
  const auto reader = CreateFileTypeInfo(stream, extension);
  EXPECT_EQ(Testing::TakeBitmap(reader->CreateThumbnail({256, 256})).width, 256);
  EXPECT_EQ(buffer.bytesRead, static_cast<std::int64_t>(head.size()) + kFrameBytes);
  return meter.Peak();
}

TEST(LargeFrame, ThumbnailTakesMemoryForABandAndNotForTheFrame) {
  constexpr std::int64_t kMax = 1 << 20;
  EXPECT_LT(PeakOfThumbnail(Testing::MrcFile{.nx = kEdge, .ny = kEdge, .mode = 2}.Bytes(), L"mrc"), kMax);
  EXPECT_LT(PeakOfThumbnail(Testing::PackedRawFile(DataType::kInt32, kEdge, kEdge, "").Bytes(), L"raw"),
            kMax);
}

/// A pixel type, and the bytes of a block's average.
struct Case {
  PixelType type;
  std::int64_t averageBytes;
};

class ThumbnailMemory : public testing::TestWithParam<Case> {};

constexpr std::int64_t kBandBytes = 256 * 1024;
constexpr std::int64_t kSumsAndObjects = 96 * 1024;  // for a row of blocks, and for batches of complex pixels

/// Returns the most memory in use, in bytes, while a frame is reduced to `side` by `side` pixels, without the
/// reduced image.
std::int64_t PeakBesideTheReducedImage(const FrameLayout& layout, LONG side, std::int64_t averageBytes) {
  Testing::MemoryBuffer buffer("");
  buffer.trailingZeros = layout.blockBytes;
  std::istream stream(&buffer);
  const Testing::HeapMeter meter;
  const HBITMAP bitmap = ReadThumbnail(stream, layout, {side, side});
  const std::int64_t peak = meter.Peak();
  EXPECT_EQ(Testing::TakeBitmap(bitmap).width, side);
  return peak - side * side * averageBytes;
}

TEST_P(ThumbnailMemory, IsTheReducedImageAndTheLargerOfBandAndBitmap) {
  constexpr LONG kSide = 600;
  constexpr std::int64_t kBitmapBytes = std::int64_t{kSide} * kSide;
  const FrameLayout layout = PackedLayout(GetParam().type, {2 * kSide, 2 * kSide}, 0);
  EXPECT_LE(PeakBesideTheReducedImage(layout, kSide, GetParam().averageBytes),
            std::max(kBandBytes, kBitmapBytes) + kSumsAndObjects);
}

TEST_P(ThumbnailMemory, OfInterleavedRowsAndColumnsIsTheReducedImageAndTwoBands) {
  constexpr LONG kSide = 96;
  constexpr std::int64_t kStride = 16'000;
  const FrameLayout layout{.type = GetParam().type,
                           .size = {2 * kSide, 2 * kSide},
                           .blockBytes = 2 * (2 * kSide - 1) * kStride + GetParam().type.bytes(),
                           .pixelStride = kStride,
                           .rowStride = kStride};
  EXPECT_LE(PeakBesideTheReducedImage(layout, kSide, GetParam().averageBytes),
            2 * kBandBytes + kSumsAndObjects);
}

INSTANTIATE_TEST_SUITE_P(
    All, ThumbnailMemory,
    testing::Values(Case{PixelTypeOf(DataType::kUInt8), 1}, Case{PixelTypeOf(DataType::kInt16), 2},
                    Case{PixelTypeOf(DataType::kUInt32), 4}, Case{PixelTypeOf(DataType::kFloat32), 4},
                    Case{PixelTypeOf(DataType::kFloat64), 8},
                    Case{PixelType::Of<ComplexPixel<std::int16_t>>(L"complex int16"), 4},
                    Case{PixelTypeOf(DataType::kComplexFloat64), 4}, Case{PixelTypeOf(DataType::kRgb24), 3}));

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
