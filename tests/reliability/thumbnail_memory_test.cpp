// What a thumbnail takes from the heap while it is made.
#include <gtest/gtest.h>

#include <istream>
#include <string>

#include "allocation_meter.h"
#include "bitmap_pixels.h"
#include "frame_reader.h"
#include "memory_buffer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

struct Case {
  PixelFormat format;
  std::int64_t valueBytes;  // of an average
};

class ThumbnailMemory : public testing::TestWithParam<Case> {};

TEST_P(ThumbnailMemory, IsTheBandAndTheAveragesWithTheBitmapAmongThem) {
  constexpr std::int64_t kBandBytes = 256 * 1024;
  constexpr std::int64_t kSumsAndObjects = 96 * 1024;  // of a row of blocks, and of complex pixels in batches
  constexpr std::int32_t kEdge = 600;
  const FrameLayout layout = PackedLayout(GetParam().format, {2 * kEdge, 2 * kEdge}, 0);
  const std::string file(static_cast<std::size_t>(layout.blockBytes), '\1');
  Testing::MemoryBuffer buffer(file);
  std::istream stream(&buffer);
  const Testing::HeapMeter meter;
  const HBITMAP bitmap = ReadThumbnail(stream, layout, {kEdge, kEdge});
  const std::int64_t peak = meter.Peak();
  EXPECT_EQ(Testing::TakeBitmap(bitmap).width, kEdge);
  EXPECT_LE(peak, kEdge * kEdge * GetParam().valueBytes + kBandBytes + kSumsAndObjects);
}

INSTANTIATE_TEST_SUITE_P(All, ThumbnailMemory,
                         testing::Values(Case{PixelFormat::kUInt8, 1}, Case{PixelFormat::kInt16, 2},
                                         Case{PixelFormat::kUInt32, 4}, Case{PixelFormat::kFloat32, 4},
                                         Case{PixelFormat::kFloat64, 8}, Case{PixelFormat::kComplexInt16, 4},
                                         Case{PixelFormat::kComplexFloat64, 4},
                                         Case{PixelFormat::kRgb24, 3}));

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
