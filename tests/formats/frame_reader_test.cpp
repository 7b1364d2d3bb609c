// Compares streamed frames of every pixel type and layout with the naive picture of the same bytes.
#include "frame_reader.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <sstream>
#include <string>
#include <vector>

#include "bitmap_pixels.h"
#include "data_type.h"
#include "memory_buffer.h"
#include "naive_thumbnail.h"
#include "random_values.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BitmapPixels;
using Testing::MemoryBuffer;
using Testing::NaiveFrame;
using Testing::Random;
using Testing::TakeBitmap;

const PixelType kUInt8 = PixelTypeOf(DataType::kUInt8);
const PixelType kUInt16 = PixelTypeOf(DataType::kUInt16);
const PixelType kInt16 = PixelTypeOf(DataType::kInt16);
const PixelType kInt32 = PixelTypeOf(DataType::kInt32);
const PixelType kFloat32 = PixelTypeOf(DataType::kFloat32);
const PixelType kComplexFloat32 = PixelTypeOf(DataType::kComplexFloat32);
const PixelType kRgb24 = PixelTypeOf(DataType::kRgb24);

const PixelType kTypes[] = {
    kUInt8,
    kUInt16,
    PixelTypeOf(DataType::kUInt32),
    PixelTypeOf(DataType::kInt8),
    kInt16,
    kInt32,
    kFloat32,
    PixelTypeOf(DataType::kFloat64),
    PixelType::Of<ComplexPixel<std::int16_t>>(L"complex int16"),
    kComplexFloat32,
    PixelTypeOf(DataType::kComplexFloat64),
    kRgb24,
    PixelTypeOf(DataType::kBgr24),
};

/// Returns the bytes of a file: `before` bytes of something else, then the block, all random.
std::string RandomFile(Random& random, std::int64_t before, std::int64_t blockBytes) {
  std::string bytes(static_cast<std::size_t>(before + blockBytes), '\0');
  for (char& byte : bytes) byte = static_cast<char>(random.Bits());
  return bytes;
}

template <class T>
NaiveFrame<T> Decode(const std::string& file, const FrameLayout& layout) {
  NaiveFrame<T> frame{layout.size.width, layout.size.height, {}};
  for (int y = 0; y < frame.height; ++y) {
    for (int x = 0; x < frame.width; ++x) {
      const std::int64_t position =
          layout.blockPosition + layout.firstPixel + x * layout.pixelStride + y * layout.rowStride;
      char bytes[sizeof(T)];
      std::copy_n(file.begin() + position, sizeof(T), bytes);
      if (layout.swapBytes) std::swap(bytes[0], bytes[sizeof(T) - 1]);
      T value;
      std::memcpy(&value, bytes, sizeof(T));
      frame.values.push_back(value);
    }
  }
  return frame;
}

struct NaivePictureOf {
  const std::string& file;
  const FrameLayout& layout;
  SIZE request;

  template <class T>
  BitmapPixels operator()(std::type_identity<T>) const {
    return Testing::NaiveGreyThumbnail(Decode<T>(file, layout), request.cx, request.cy);
  }

  template <class T>
  BitmapPixels operator()(std::type_identity<ComplexPixel<T>>) const {
    const auto frame = Decode<Testing::NaiveComplex<T>>(file, layout);
    return Testing::NaiveComplexThumbnail(frame, request.cx, request.cy);
  }

  template <ColourOrder kOrder>
  BitmapPixels operator()(std::type_identity<ColourPixel<kOrder>>) const {
    auto frame = Decode<Testing::NaiveColour>(file, layout);
    if (kOrder == ColourOrder::kBlueFirst) {
      for (Testing::NaiveColour& colour : frame.values) std::swap(colour[0], colour[2]);
    }
    return Testing::NaiveColourThumbnail(frame, request.cx, request.cy);
  }

  BitmapPixels operator()(std::monostate) const { return {}; }
};

/// Returns a layout whose pixels may have gaps. Rows are contiguous, or columns if `byColumn`. Pixels may
/// overlap.
FrameLayout RandomLayout(Random& random, const PixelType& type, Size2 size, bool byColumn) {
  FrameLayout layout;
  layout.type = type;
  layout.size = size;
  const std::int64_t pixelBytes = type.bytes();
  std::int64_t& inner = byColumn ? layout.rowStride : layout.pixelStride;
  std::int64_t& outer = byColumn ? layout.pixelStride : layout.rowStride;
  inner = pixelBytes + (random.OneIn(3) ? random.Between(0, 9) : 0);
  outer = inner * (byColumn ? size.height : size.width) + (random.OneIn(3) ? random.Between(0, 99) : 0);
  if (random.OneIn(8)) inner = random.Between(0, static_cast<int>(pixelBytes));
  if (random.OneIn(8)) outer = random.Between(0, 9);
  if (random.OneIn(3)) inner = -inner;
  if (random.OneIn(2)) outer = -outer;
  const std::int64_t right = (size.width - 1) * layout.pixelStride;
  const std::int64_t down = (size.height - 1) * layout.rowStride;
  layout.firstPixel = -std::min<std::int64_t>(right, 0) - std::min<std::int64_t>(down, 0);
  layout.blockBytes = std::abs(right) + std::abs(down) + pixelBytes;
  layout.blockPosition = random.Between(0, 100);
  layout.swapBytes =
      pixelBytes == 2 && random.OneIn(3) && layout.pixelStride % 2 == 0 && layout.rowStride % 2 == 0;
  return layout;
}

void CompareWithTheNaivePicture(Random& random, const FrameLayout& layout, int cx, int cy) {
  const std::string file = RandomFile(random, layout.blockPosition, layout.blockBytes);
  std::istringstream stream(file);
  ASSERT_EQ(TakeBitmap(ReadThumbnail(stream, layout, {cx, cy})),
            std::visit(NaivePictureOf{file, layout, {cx, cy}}, layout.type.tag))
      << layout.type.bits << " bits (" << layout.type.tag.index() << "), " << layout.size.width << " x "
      << layout.size.height << " requested as " << cx << " x " << cy << ", strides " << layout.pixelStride
      << " and " << layout.rowStride;
  EXPECT_TRUE(stream.good());
}

TEST(FrameReader, EqualsTheNaivePictureOverRandomLayouts) {
  Random random(1);
  for (int round = 0; round < 1500; ++round) {
    const Size2 size{random.Between(1, 90), random.Between(1, 90)};
    const PixelType& type = kTypes[random.Between(0, static_cast<int>(std::size(kTypes)) - 1)];
    const FrameLayout layout = RandomLayout(random, type, size, random.OneIn(4));
    CompareWithTheNaivePicture(random, layout, random.Between(1, size.width), random.Between(1, 100));
    if (HasFatalFailure()) return;
  }
}

TEST(FrameReader, EqualsTheNaivePictureForFramesLargerThanTheBand) {
  Random random(2);
  const Size2 shapes[] = {{700, 300}, {300, 700},  {90000, 4}, {200000, 2},
                          {4, 90000}, {2, 200000}, {512, 512}};
  for (const Size2& size : shapes) {
    for (const PixelType& type : kTypes) {
      const FrameLayout layout = RandomLayout(random, type, size, random.OneIn(2));
      const int f = std::max(1, std::min(size.width, size.height) / random.Between(1, 3));
      CompareWithTheNaivePicture(random, layout, std::max(1, size.width / f), std::max(1, size.height / f));
      if (HasFatalFailure()) return;
    }
  }
}

TEST(FrameReader, BlockRowsLargerThanTheBandAreSummedFromTheTop) {
  // A row of blocks has 800,000 bytes: 2000 floats by 100 rows.
  Random random(3);
  for (const PixelType& type : {kFloat32, kInt32, kComplexFloat32}) {
    for (const bool bottomUp : {false, true}) {
      FrameLayout layout = PackedLayout(type, {2000, 201}, 17);
      if (bottomUp) layout = FlippedVertically(layout);
      CompareWithTheNaivePicture(random, layout, 20, 2);
      if (HasFatalFailure()) return;
    }
  }
}

TEST(FrameReader, ReadsEachByteOfTheWholeBlocksOnce) {
  const std::string file(2'000'000, '\1');
  MemoryBuffer buffer(file);
  std::istream stream(&buffer);
  const FrameLayout layout = FlippedVertically(PackedLayout(kInt16, {1000, 999}, 100));
  EXPECT_EQ(TakeBitmap(ReadThumbnail(stream, layout, {100, 100})).height, 99);
  EXPECT_EQ(buffer.bytesRead, 1000 * 990 * 2);
  EXPECT_LE(buffer.largestRead, 256 * 1024);
  EXPECT_LE(buffer.reads, 16);
}

TEST(FrameReader, AWideRowIsReadInFullBuffers) {
  constexpr std::int32_t kBuffer = 256 * 1024;
  const std::string file(2 * kBuffer + 100, '\1');
  MemoryBuffer buffer(file);
  std::istream stream(&buffer);
  EXPECT_EQ(
      TakeBitmap(ReadThumbnail(stream, PackedLayout(kUInt8, {2 * kBuffer, 1}, 100), {2 * kBuffer, 1})).width,
      2 * kBuffer);
  EXPECT_EQ(buffer.reads, 2);
  EXPECT_EQ(buffer.largestRead, kBuffer);
}

TEST(FrameReader, ReadsColumnsOnceWhenTheFileIsStoredByColumn) {
  const std::string file(2'000'000, '\1');
  MemoryBuffer buffer(file);
  std::istream stream(&buffer);
  FrameLayout layout = PackedLayout(kInt16, {1000, 1000}, 0);
  std::swap(layout.pixelStride, layout.rowStride);
  EXPECT_EQ(TakeBitmap(ReadThumbnail(stream, layout, {100, 100})).width, 100);
  EXPECT_EQ(buffer.bytesRead, 2'000'000);
}

/// Returns a layout whose pixel stride equals its row stride, so that neither rows nor columns are
/// contiguous.
FrameLayout InterleavedLayout(const PixelType& type, std::int32_t edge, std::int64_t stride) {
  return {.type = type,
          .size = {edge, edge},
          .blockPosition = 10,
          .blockBytes = 2 * (edge - 1) * stride + type.bytes(),
          .pixelStride = stride,
          .rowStride = stride};
}

TEST(FrameReader, InterleavedRowsAndColumnsAreReadInTiles) {
  Random random(4);
  for (const PixelType& type : kTypes) {
    FrameLayout layout = InterleavedLayout(type, 100, random.Between(2000, 4000));
    CompareWithTheNaivePicture(random, layout, 100, 100);
    layout.firstPixel = (100 - 1) * layout.rowStride;
    layout.rowStride = -layout.rowStride;
    CompareWithTheNaivePicture(random, layout, 30, 30);
    layout.firstPixel *= 2;
    layout.pixelStride = -layout.pixelStride;
    CompareWithTheNaivePicture(random, layout, 2, 2);
    if (HasFatalFailure()) return;
  }
}

/// Returns a layout with these strides, either of which may be negative, whose block begins with its lowest
/// pixel.
FrameLayout LayoutOfSteps(const PixelType& type, Size2 size, std::int64_t pixelStride,
                          std::int64_t rowStride) {
  const std::int64_t right = (size.width - 1) * pixelStride;
  const std::int64_t down = (size.height - 1) * rowStride;
  return {.type = type,
          .size = size,
          .blockPosition = 10,
          .blockBytes = std::abs(right) + std::abs(down) + type.bytes(),
          .firstPixel = -std::min<std::int64_t>(right, 0) - std::min<std::int64_t>(down, 0),
          .pixelStride = pixelStride,
          .rowStride = rowStride};
}

TEST(FrameReader, TilesOfEveryShapeGiveTheSamePicture) {
  struct Shape {
    Size2 size;
    std::int64_t pixelStride, rowStride;
    SIZE request;
  };
  constexpr Shape kShapes[] = {
      {{40, 30}, 20'000, 20'000, {40, 30}},  // every pixel takes one read
      {{40, 30}, 20'000, -20'000, {8, 8}},   //
      {{30, 40}, -10'000, 30'000, {1, 1}},   //
      {{30'000, 2}, 30, 20, {15'000, 1}},    // a frame of a few rows
      {{2, 30'000}, 20, 30, {1, 15'000}},    // a frame of a few columns
      {{400'000, 3}, 1, 0, {133'000, 1}},    // the same row three times, longer than the buffer
      {{3, 400'000}, 0, 1, {1, 133'000}},    // the same column three times
      {{3000, 100}, 100, 1, {96, 96}},       // overlapping rows, stored by column
      {{300, 1000}, 3000, 3, {33, 33}},      // contiguous columns
      {{300, 1000}, 3000, -3, {300, 1000}},  //
  };
  Random random(5);
  for (const Shape& shape : kShapes) {
    for (const PixelType& type : {kUInt8, kFloat32, kComplexFloat32}) {
      const FrameLayout layout = LayoutOfSteps(type, shape.size, shape.pixelStride, shape.rowStride);
      CompareWithTheNaivePicture(random, layout, shape.request.cx, shape.request.cy);
      if (HasFatalFailure()) return;
    }
  }
}

/// The cost of the thumbnail of a file whose bytes are all 0.
struct Cost {
  bool shown;
  std::int64_t reads;
  std::int64_t bytesRead;
  std::int64_t largestRead;
  std::int64_t readsBackward;
};

Cost CostOf(const FrameLayout& layout, const SIZE& request) {
  MemoryBuffer buffer("");
  buffer.trailingZeros = layout.blockPosition + layout.blockBytes;
  std::istream stream(&buffer);
  const bool shown = TakeBitmap(ReadThumbnail(stream, layout, request)).width > 0;
  EXPECT_EQ(stream.good(), shown);
  return {shown, buffer.reads, buffer.bytesRead, buffer.largestRead, buffer.readsBackward};
}

TEST(FrameReader, BandsAreReadInTheOrderOfTheFile) {
  const FrameLayout topDown = PackedLayout(kUInt16, {1000, 1000}, 10);
  for (const FrameLayout& layout : {topDown, FlippedVertically(topDown)}) {
    for (const LONG request : {1000, 100, 10}) {
      const Cost cost = CostOf(layout, {request, request});
      EXPECT_GT(cost.reads, 7);
      EXPECT_EQ(cost.readsBackward, 0) << layout.rowStride << ", " << request;
    }
  }
}

TEST(FrameReader, OverlappingRowsAreReadOneByOneUpToEightTimesTheBlock) {
  // Each row is nearly as long as a band, and begins an eighth of a band after the row above.
  FrameLayout layout = LayoutOfSteps(kUInt8, {250'000, 250}, 1, 31'000);
  EXPECT_EQ(CostOf(layout, {1000, 1}).bytesRead, 250 * 250'000);
  layout = LayoutOfSteps(kUInt8, {250'000, 250}, 1, 30'000);
  const Cost cost = CostOf(layout, {1000, 1});
  EXPECT_TRUE(cost.shown);
  EXPECT_LT(cost.bytesRead, 50'000'000);
}

TEST(FrameReader, PixelsFartherApartThanAShortReadAreReadOneByOne) {
  // Eight by eight pixels fit into the band, which is one pixel for every 4091 bytes.
  Cost cost = CostOf(InterleavedLayout(kUInt8, 512, 18'700), {512, 512});
  EXPECT_EQ(cost.reads, 64 * 64);
  EXPECT_EQ(cost.bytesRead, 64 * 64 * (14 * 18'700 + 1));
  // Only eight by four pixels fit, which is one pixel for every 6250 bytes.
  cost = CostOf(InterleavedLayout(kUInt8, 512, 20'000), {512, 512});
  EXPECT_EQ(cost.reads, 512 * 512);
  EXPECT_EQ(cost.bytesRead, 512 * 512);
}

TEST(FrameReader, ReadsOfScatteredPixelsAreLimited) {
  // The limit is 16 GiB, and a read of one pixel counts as 4 KiB.
  FrameLayout layout = LayoutOfSteps(kUInt8, {2048, 2048}, 20'000, 20'000);
  EXPECT_EQ(CostOf(layout, {2048, 2048}).reads, 2048 * 2048);
  layout = LayoutOfSteps(kUInt8, {2048, 2560}, 20'000, 20'000);
  EXPECT_EQ(CostOf(layout, {2048, 2560}).reads, 0);
}

TEST(FrameReader, ALargeInterleavedBlockIsReadInLargeTiles) {
  const FrameLayout layout = InterleavedLayout(kUInt8, 1500, 6000);
  ASSERT_GT(layout.blockBytes, 16 * 1024 * 1024);
  const Cost cost = CostOf(layout, {100, 100});
  EXPECT_TRUE(cost.shown);
  EXPECT_LE(cost.largestRead, 256 * 1024);
  // Each read covers at least a square of 16 by 16 pixels.
  EXPECT_LE(cost.reads, 100 * 100);
}

TEST(FrameReader, RefusesAScatteredFrameBeforeAnyRead) {
  // A read would give only 64 pixels.
  const FrameLayout few = InterleavedLayout(kUInt8, 40'000, 20'001);
  // A row of a block has 16,400 pixels, more than the buffer holds.
  const FrameLayout wide =
      LayoutOfSteps(PixelTypeOf(DataType::kComplexFloat64), {16'400, 16'400}, 16, 12'600);
  for (const Cost& cost : {CostOf(few, {256, 256}), CostOf(wide, {1, 1})}) {
    EXPECT_FALSE(cost.shown);
    EXPECT_EQ(cost.reads, 0);
  }
}

TEST(FrameReader, AFailureOfAnyReadGivesNoBitmap) {
  const FrameLayout layout = PackedLayout(kFloat32, {600, 600}, 0);
  const std::string file(std::size_t{600} * 600 * 4, '\0');
  std::int64_t reads = 0;
  {
    MemoryBuffer buffer(file);
    std::istream stream(&buffer);
    EXPECT_NE(TakeBitmap(ReadThumbnail(stream, layout, {60, 60})).width, 0);
    reads = buffer.reads;
  }
  ASSERT_GT(reads, 3);
  for (std::int64_t i = 0; i < reads; ++i) {
    MemoryBuffer buffer(file);
    buffer.failingRead = i;
    std::istream stream(&buffer);
    EXPECT_EQ(ReadThumbnail(stream, layout, {60, 60}), nullptr);
    EXPECT_TRUE(stream.fail());
  }
}

TEST(FrameReader, AnIncompleteBlockIsRefusedBeforeAnyRead) {
  // The last row is required although the reduction drops it.
  const FrameLayout layout = PackedLayout(kUInt8, {100, 101}, 10);
  for (const std::size_t size : {0u, 9u, 10u, 10u + 100u * 100u, 10u + 100u * 101u - 1u}) {
    const std::string file(size, '\0');
    MemoryBuffer buffer(file);
    std::istream stream(&buffer);
    EXPECT_EQ(ReadThumbnail(stream, layout, {50, 50}), nullptr) << size;
    EXPECT_EQ(buffer.reads, 0);
    EXPECT_EQ(stream.rdstate(), std::ios_base::failbit | std::ios_base::eofbit);  // as after a short read
  }
  std::istringstream whole(std::string(10 + 100 * 101, '\0'));
  EXPECT_NE(TakeBitmap(ReadThumbnail(whole, layout, {50, 50})).width, 0);
}

TEST(FrameReader, AFrameWithoutPixelsHasNoBitmap) {
  std::istringstream stream(std::string(1000, '\0'));
  for (const PixelType& type : {kUInt8, kRgb24}) {
    for (const Size2& size : {Size2{0, 0}, Size2{0, 5}, Size2{5, 0}, Size2{-5, -5}, Size2{-300, 300}}) {
      EXPECT_EQ(ReadThumbnail(stream, PackedLayout(type, size, 0), {96, 96}), nullptr);
    }
  }
  EXPECT_TRUE(stream.good());
}

TEST(FrameReader, AFrameOfAnUnknownTypeHasNoBitmap) {
  std::istringstream stream(std::string(1000, '\0'));
  EXPECT_EQ(ReadThumbnail(stream, PackedLayout(PixelTypeOf(DataType{3}), {5, 5}, 0), {96, 96}), nullptr);
  EXPECT_TRUE(stream.good());
}

TEST(FrameReader, APixelOutsideTheBlockFailsTheStream) {
  const FrameLayout packed = PackedLayout(kUInt16, {4, 4}, 100);
  const auto refused = [](const FrameLayout& layout) {
    std::istringstream stream(std::string(1000, '\0'));
    const bool shown = TakeBitmap(ReadThumbnail(stream, layout, {8, 8})).width > 0;
    EXPECT_EQ(stream.good(), shown);
    return !shown;
  };
  ASSERT_FALSE(refused(packed));
  FrameLayout layout = packed;
  layout.firstPixel = -1;
  EXPECT_TRUE(refused(layout));
  layout.firstPixel = 1;
  EXPECT_TRUE(refused(layout));
  layout = packed;
  layout.rowStride = -8;
  EXPECT_TRUE(refused(layout));
  layout = packed;
  layout.pixelStride = 2'000'000'000;
  EXPECT_TRUE(refused(layout));
  layout = packed;
  layout.blockBytes = 31;
  EXPECT_TRUE(refused(layout));
  // 65536 * 65536 pixels would wrap to 0.
  EXPECT_TRUE(refused(PackedLayout(kUInt8, {65536, 65536}, 0)));
}

TEST(FrameReader, ANegativePositionFailsTheStream) {
  for (const SIZE request : {SIZE{8, 8}, SIZE{1, 1}}) {  // the second one needs no pixels
    std::istringstream stream(std::string(1000, '\0'));
    EXPECT_EQ(ReadThumbnail(stream, PackedLayout(kUInt8, {4, 1}, -1), request), nullptr);
    EXPECT_TRUE(stream.fail());
  }
}

TEST(FrameReader, OverlappingPixelsAreShown) {
  Random random(6);
  CompareWithTheNaivePicture(random, LayoutOfSteps(kUInt8, {512, 512}, 1, 511), 256, 256);
  CompareWithTheNaivePicture(random, LayoutOfSteps(kUInt8, {1024, 1024}, 1, 0), 96, 96);
  CompareWithTheNaivePicture(random, LayoutOfSteps(kUInt16, {2048, 1500}, 0, 0), 256, 256);
  CompareWithTheNaivePicture(random, LayoutOfSteps(kUInt8, {4000, 3000}, 1, 1), 256, 256);
}

TEST(FrameReader, AFrameMayHaveSixtyFourMebipixelsMoreThanBytes) {
  FrameLayout layout{.type = kUInt8, .size = {8192, 8193}, .blockPosition = 0, .blockBytes = 8192};
  EXPECT_TRUE(CostOf(layout, {96, 96}).shown);
  --layout.blockBytes;
  const Cost cost = CostOf(layout, {96, 96});
  EXPECT_FALSE(cost.shown);
  EXPECT_EQ(cost.reads, 0);
}

TEST(FrameReader, AFailedStreamGivesNoBitmap) {
  std::istringstream stream(std::string(1000, '\0'));
  stream.setstate(std::ios_base::failbit);
  EXPECT_EQ(ReadThumbnail(stream, PackedLayout(kUInt8, {4, 4}, 0), {8, 8}), nullptr);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
