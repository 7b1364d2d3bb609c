// Compares whole pictures with the naive reference, and tests the rules for the size and the values of a
// picture.
#include <gtest/gtest.h>
#include <windows.h>

#include <cmath>
#include <cstring>
#include <limits>
#include <new>
#include <vector>

#include "bitmap_pixels.h"
#include "naive_thumbnail.h"
#include "random_values.h"
#include "whole_frame.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BitmapPixels;
using Testing::NaiveColour;
using Testing::NaiveComplex;
using Testing::NaiveFrame;
using Testing::Random;
using Testing::TakeBitmap;
using Testing::Values;

/// A frame's pixels in memory, with any strides and alignment.
template <class Pixel>
class StoredFrame {
 public:
  StoredFrame(int width, int height, std::int64_t pixelStride, std::int64_t rowStride,
              std::size_t misalignment) {
    const std::int64_t right = (width - 1) * pixelStride;
    const std::int64_t down = (height - 1) * rowStride;
    const std::int64_t first = -std::min<std::int64_t>(right, 0) - std::min<std::int64_t>(down, 0);
    bytes_.resize(static_cast<std::size_t>(std::abs(right) + std::abs(down)) + sizeof(Pixel) + misalignment);
    view_ = {width, height, reinterpret_cast<Pixel*>(bytes_.data() + misalignment + first), pixelStride,
             rowStride};
  }

  void Set(int x, int y, const Pixel& pixel) { view_.Store(x, y, pixel); }

  ImageView<const Pixel> view() const {
    return {view_.width, view_.height, view_.data, view_.pixelStride, view_.rowStride};
  }

 private:
  std::vector<std::byte> bytes_;
  ImageView<Pixel> view_;
};

template <class Pixel, class Value, class Convert>
StoredFrame<Pixel> Store(const NaiveFrame<Value>& frame, std::int64_t pixelStride, std::int64_t rowStride,
                         std::size_t misalignment, Convert convert) {
  StoredFrame<Pixel> stored(frame.width, frame.height, pixelStride, rowStride, misalignment);
  for (int y = 0; y < frame.height; ++y) {
    for (int x = 0; x < frame.width; ++x) stored.Set(x, y, convert(frame.at(x, y)));
  }
  return stored;
}

template <class T>
StoredFrame<T> StorePacked(const NaiveFrame<T>& frame) {
  return Store<T>(frame, sizeof(T), frame.width * static_cast<std::int64_t>(sizeof(T)), 0,
                  [](const T& value) { return value; });
}

template <class T>
BitmapPixels Grey(const NaiveFrame<T>& frame, SIZE request) {
  const auto stored = StorePacked(frame);
  return TakeBitmap(RenderGreyThumbnail<T>(stored.view(), request));
}

template <class T>
NaiveFrame<T> Constant(int width, int height, T value) {
  return {width, height, std::vector<T>(static_cast<std::size_t>(width * height), value)};
}

/// Returns a random pixel stride and row stride: packed, padded, interleaved, bottom-up or mirrored.
template <class Pixel>
std::pair<std::int64_t, std::int64_t> RandomStrides(Random& random, int width) {
  std::int64_t pixel = sizeof(Pixel);
  if (random.OneIn(3)) pixel += random.Between(1, 7);
  std::int64_t row = pixel * width;
  if (random.OneIn(3)) row += random.Between(1, 33);
  if (random.OneIn(3)) pixel = -pixel;
  if (random.OneIn(2)) row = -row;
  return {pixel, row};
}

template <class T>
class EveryScalar : public testing::Test {};
using Scalars = testing::Types<std::uint8_t, std::int8_t, std::uint16_t, std::int16_t, std::uint32_t,
                               std::int32_t, float, double>;
TYPED_TEST_SUITE(EveryScalar, Scalars);

TYPED_TEST(EveryScalar, EqualsTheNaivePictureOverRandomShapes) {
  using T = TypeParam;
  Random random(sizeof(T) + (std::is_signed_v<T> ? 100 : 200));
  for (int round = 0; round < 400; ++round) {
    const int width = random.Between(1, 180);
    const int height = random.Between(1, 180);
    const int cx = random.Between(1, 120);
    const int cy = random.Between(1, 120);
    const auto values = static_cast<Values>(random.Between(0, static_cast<int>(Values::kCount) - 1));
    const auto [pixelStride, rowStride] = RandomStrides<T>(random, width);
    const auto frame = random.Frame<T>(width, height, values);
    const auto stored =
        Store<T>(frame, pixelStride, rowStride, static_cast<std::size_t>(random.Between(0, 7)),
                 [](const T& value) { return value; });
    ASSERT_EQ(TakeBitmap(RenderGreyThumbnail<T>(stored.view(), {cx, cy})),
              Testing::NaiveGreyThumbnail(frame, cx, cy))
        << width << " x " << height << " requested as " << cx << " x " << cy << ", values "
        << static_cast<int>(values) << ", strides " << pixelStride << " and " << rowStride;
  }
}

TYPED_TEST(EveryScalar, EqualsTheNaivePictureOfWideFrames) {
  using T = TypeParam;
  Random random(123);
  for (int round = 0; round < 40; ++round) {
    const int width = random.Between(200, 2000);
    const int height = random.Between(1, 12);
    const int cx = random.Between(width / 4, width);
    const auto values = static_cast<Values>(random.Between(0, static_cast<int>(Values::kCount) - 1));
    const auto frame = random.Frame<T>(width, height, values);
    ASSERT_EQ(Grey(frame, {cx, height}), Testing::NaiveGreyThumbnail(frame, cx, height))
        << width << " x " << height << " requested as " << cx << ", values " << static_cast<int>(values);
  }
}

TYPED_TEST(EveryScalar, EqualsTheNaivePictureWithLargeBlocks) {
  using T = TypeParam;
  Random random(77);
  for (const Values values : {Values::kWholeRange, Values::kMaximum, Values::kMinimum}) {
    const auto frame = random.Frame<T>(700, 610, values);
    ASSERT_EQ(Grey(frame, {2, 2}), Testing::NaiveGreyThumbnail(frame, 2, 2));
  }
}

TYPED_TEST(EveryScalar, ConstantFrameIsBlack) {
  using T = TypeParam;
  for (const T value : {std::numeric_limits<T>::lowest(), T{0}, T{1}, std::numeric_limits<T>::max()}) {
    const auto picture = Grey(Constant<T>(5, 4, value), {10, 10});
    EXPECT_EQ(picture.bytes, std::vector<std::uint8_t>(20, 0));
  }
}

TYPED_TEST(EveryScalar, StretchesItsOwnRange) {
  using T = TypeParam;
  const NaiveFrame<T> frame{3, 1, {T{10}, T{61}, T{112}}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 127, 255}));
}

TYPED_TEST(EveryScalar, MaximumIs254WhenTheProductIsBelow255) {
  using T = TypeParam;
  // 255.0 / 100 is a little less than 2.55.
  const NaiveFrame<T> frame{2, 1, {T{10}, T{110}}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 254}));
}

TYPED_TEST(EveryScalar, StretchesTheRangeOfTheReducedImage) {
  using T = TypeParam;
  // The hot pixel of 100 is averaged with three zeros to 25; the other block is 76.
  const NaiveFrame<T> frame{4, 2, {T{100}, T{0}, T{76}, T{76}, T{0}, T{0}, T{76}, T{76}}};
  EXPECT_EQ(Grey(frame, {2, 1}).bytes, (std::vector<std::uint8_t>{0, 255}));
}

TEST(GreyThumbnail, HasPaddedRowsAndAGreyRamp) {
  Random random(3);
  const auto picture = Grey(random.Frame<std::uint8_t>(1000, 600, Values::kWholeRange), {256, 256});
  EXPECT_EQ(picture.width, 333);
  EXPECT_EQ(picture.height, 200);
  EXPECT_EQ(picture.rowBytes, 336);
  EXPECT_EQ(picture.bits, 8);
  ASSERT_EQ(picture.colours.size(), 256u);
  for (std::size_t i = 0; i < 256; ++i) {
    const RGBQUAD& colour = picture.colours[i];
    EXPECT_EQ(colour.rgbBlue, i);
    EXPECT_EQ(colour.rgbGreen, i);
    EXPECT_EQ(colour.rgbRed, i);
  }
}

TEST(GreyThumbnail, DropsPartialBlocksAtTheRightAndTheBottom) {
  Random random(5);
  auto frame = random.Frame<std::uint16_t>(1000, 602, Values::kSmall);
  const auto before = Grey(frame, {256, 256});
  for (int y = 0; y < 602; ++y) frame.values[static_cast<std::size_t>(y) * 1000 + 999] = 65535;
  for (int x = 0; x < 1000; ++x) frame.values[static_cast<std::size_t>(x) + std::size_t{601} * 1000] = 65535;
  EXPECT_EQ(Grey(frame, {256, 256}), before);
}

TEST(GreyThumbnail, NeverEnlarges) {
  const auto picture = Grey(Constant<std::int16_t>(3, 2, 5), {256, 256});
  EXPECT_EQ(picture.width, 3);
  EXPECT_EQ(picture.height, 2);
}

TEST(GreyThumbnail, CanBeNearlyTwiceTheRequest) {
  const auto picture = Grey(Constant<std::uint8_t>(1000, 1000, 5), {96, 96});
  EXPECT_EQ(picture.width, 100);
  EXPECT_EQ(picture.height, 100);
}

TEST(GreyThumbnail, FrameThatReducesToNothingHasNoBitmap) {
  // A request of 256 by 256 reduces 5000 by 1 pixels by 19, which leaves no row.
  EXPECT_EQ(
      RenderGreyThumbnail<std::uint8_t>(StorePacked(Constant<std::uint8_t>(5000, 1, 5)).view(), {256, 256}),
      nullptr);
}

TEST(GreyThumbnail, FrameWithoutPixelsHasNoBitmap) {
  EXPECT_EQ(RenderGreyThumbnail<std::uint8_t>(ImageView<const std::uint8_t>{}, {96, 96}), nullptr);
  EXPECT_EQ(RenderGreyThumbnail<float>(ImageView<const float>{-300, -300, nullptr, 4, -1200}, {96, 96}),
            nullptr);
}

TEST(GreyThumbnail, IgnoresANegativeRequestInOneDirection) {
  Random random(8);
  const auto frame = random.Frame<std::uint8_t>(40, 40, Values::kWholeRange);
  EXPECT_EQ(Grey(frame, {-5, 10}), Testing::NaiveGreyThumbnail(frame, 10, 10));
}

TEST(GreyThumbnail, KeepsTheSizeForARequestNegativeInBothDirections) {
  Random random(8);
  const auto frame = random.Frame<std::uint8_t>(40, 30, Values::kWholeRange);
  for (const SIZE& request : {SIZE{-5, -5}, SIZE{-1, -1}, SIZE{-100, -2}}) {
    EXPECT_EQ(Grey(frame, request), Testing::NaiveGreyThumbnail(frame, 40, 30));
  }
}

TEST(GreyThumbnail, ReducedImageOfMorePixelsThan32BitsFailsToAllocate) {
  constexpr std::int32_t kEdge = 46341;  // the smallest edge whose square exceeds 31 bits
  const auto make = [] {
    MakeFrameRenderer(std::type_identity<std::uint8_t>(), {kEdge, kEdge}, {kEdge, kEdge});
  };
  EXPECT_THROW(make(), std::bad_alloc);
}

TEST(GreyThumbnail, FirstValueNaNIsBlack) {
  constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
  const NaiveFrame<float> frame{4, 1, {kNaN, 1.0f, 2.0f, 3.0f}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 0, 0, 0}));
}

TEST(GreyThumbnail, NaNElsewhereIsBlackAndDoesNotChangeTheRange) {
  constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();
  const NaiveFrame<double> frame{4, 1, {1.0, kNaN, 3.0, 2.0}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 0, 255, 127}));
}

TEST(GreyThumbnail, InfinityMakesTheRestBlack) {
  constexpr float kInfinity = std::numeric_limits<float>::infinity();
  const NaiveFrame<float> frame{3, 1, {1.0f, kInfinity, 3.0f}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 0, 0}));
}

TEST(GreyThumbnail, FloatDifferencesAreFormedInSinglePrecision) {
  // Rounded to float, the range is 255 and the difference of the middle value is 100. In double precision
  // they would be 255.000007 and 99.999999, and the middle level would be 99.
  const NaiveFrame<float> frame{3, 1, {-0.000007f, std::nextafter(100.0f, 0.0f), 255.0f}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 100, 255}));
}

TEST(GreyThumbnail, SignedDifferencesOver31BitsWrap) {
  // The range of 4,000,000,000 wraps to -294,967,296, so the scale is negative: 0 maps to
  // trunc(2e9 * 255 / -294967296) = -1729, whose low 8 bits are 63.
  const NaiveFrame<std::int32_t> frame{3, 1, {-2000000000, 0, 2000000000}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 63, 255}));
}

TEST(GreyThumbnail, UnsignedDifferencesAreExact) {
  const NaiveFrame<std::uint32_t> frame{3, 1, {0, 2147483648u, 4294967295u}};
  EXPECT_EQ(Grey(frame, {10, 10}).bytes, (std::vector<std::uint8_t>{0, 127, 255}));
}

TEST(GreyThumbnail, IntegerAveragesTruncateTowardZero) {
  // -3 / 4 and 3 / 4 both become 0; -8 / 4 is exactly -2.
  const NaiveFrame<std::int8_t> frame{6, 2, {0, 0, 0, 0, -2, -2, 0, -3, 0, 3, -2, -2}};
  EXPECT_EQ(Grey(frame, {3, 1}).bytes, (std::vector<std::uint8_t>{255, 255, 0}));
}

TYPED_TEST(EveryScalar, DownsampleBoxOfAFrameNarrowerThanABlockDoesNothing) {
  using T = TypeParam;
  constexpr auto kStep = static_cast<std::int64_t>(sizeof(T));
  const StoredFrame<T> mirrored(5, 20, -kStep, 5 * kStep, 0);
  T untouched{7};
  DownsampleBox(mirrored.view(), 7, ImageView<T>{0, 2, &untouched, kStep, 0});
  EXPECT_EQ(untouched, T{7});
}

TYPED_TEST(EveryScalar, DownsampleBoxWritesTheAverageOfEveryWholeBlock) {
  using T = TypeParam;
  Random random(9);
  for (const int factor : {1, 2, 7, 60}) {
    const auto frame = random.Frame<T>(61, 64, Values::kWholeRange);
    const auto expected = Testing::NaiveReduce(frame, factor);
    std::vector<T> averages(expected.values.size());
    DownsampleBox(StorePacked(frame).view(), factor,
                  PackedView(averages.data(), expected.width, expected.height));
    EXPECT_EQ(std::memcmp(averages.data(), expected.values.data(), averages.size() * sizeof(T)), 0) << factor;
  }
}

template <class T>
class EveryComplex : public testing::Test {};
using ComplexParts = testing::Types<std::int16_t, float, double>;
TYPED_TEST_SUITE(EveryComplex, ComplexParts);

TYPED_TEST(EveryComplex, EqualsTheNaivePictureOverRandomShapes) {
  using T = TypeParam;
  Random random(sizeof(T));
  for (int round = 0; round < 200; ++round) {
    const int width = random.Between(1, 150);
    const int height = random.Between(1, 150);
    const int cx = random.Between(1, 120);
    const int cy = random.Between(1, 120);
    const auto values = static_cast<Values>(random.Between(0, static_cast<int>(Values::kCount) - 1));
    NaiveFrame<NaiveComplex<T>> frame{width, height, {}};
    for (int i = 0; i < width * height; ++i) {
      frame.values.push_back({random.Value<T>(values, i == 0), random.Value<T>(values, i == 0)});
    }
    const auto [pixelStride, rowStride] = RandomStrides<ComplexPixel<T>>(random, width);
    const auto stored = Store<ComplexPixel<T>>(
        frame, pixelStride, rowStride, static_cast<std::size_t>(random.Between(0, 7)),
        [](const NaiveComplex<T>& value) { return ComplexPixel<T>{value.re, value.im}; });
    ASSERT_EQ(TakeBitmap(RenderComplexThumbnail<T>(stored.view(), {cx, cy})),
              Testing::NaiveComplexThumbnail(frame, cx, cy))
        << width << " x " << height << " requested as " << cx << " x " << cy;
  }
}

TYPED_TEST(EveryComplex, ZeroSampleMakesThePictureBlack) {
  using T = TypeParam;
  StoredFrame<ComplexPixel<T>> stored(2, 2, sizeof(ComplexPixel<T>), 2 * sizeof(ComplexPixel<T>), 0);
  stored.Set(0, 0, {T{3}, T{4}});
  stored.Set(1, 0, {T{30}, T{40}});
  stored.Set(0, 1, {T{0}, T{0}});
  stored.Set(1, 1, {T{5}, T{12}});
  EXPECT_EQ(TakeBitmap(RenderComplexThumbnail<T>(stored.view(), {10, 10})).bytes,
            (std::vector<std::uint8_t>{0, 0, 0, 0}));
}

TEST(ComplexThumbnail, ShowsTheLogarithm) {
  // Magnitudes of 1, 10 and 100 give evenly spaced levels.
  StoredFrame<ComplexPixel<float>> stored(3, 1, 8, 24, 0);
  stored.Set(0, 0, {1, 0});
  stored.Set(1, 0, {0, 10});
  stored.Set(2, 0, {-100, 0});
  EXPECT_EQ(TakeBitmap(RenderComplexThumbnail<float>(stored.view(), {10, 10})).bytes,
            (std::vector<std::uint8_t>{0, 127, 255}));
}

template <class T>
class EveryFloatComplex : public testing::Test {};
using FloatComplexParts = testing::Types<float, double>;
TYPED_TEST_SUITE(EveryFloatComplex, FloatComplexParts);

TYPED_TEST(EveryFloatComplex, NaNInEitherHalfIsNaN) {
  using T = TypeParam;
  constexpr T kNaN = std::numeric_limits<T>::quiet_NaN();
  const NaiveFrame<ComplexPixel<T>> frame{5, 1, {{1, 0}, {kNaN, 50}, {0, 10}, {50, kNaN}, {100, 0}}};
  const auto picture = [](const NaiveFrame<ComplexPixel<T>>& pixels) {
    return TakeBitmap(RenderComplexThumbnail<T>(StorePacked(pixels).view(), {10, 10})).bytes;
  };
  EXPECT_EQ(picture(frame), (std::vector<std::uint8_t>{0, 0, 127, 0, 255}));
  for (const ComplexPixel<T>& first : {ComplexPixel<T>{kNaN, 1}, ComplexPixel<T>{1, kNaN}}) {
    auto black = frame;
    black.values[0] = first;
    EXPECT_EQ(picture(black), std::vector<std::uint8_t>(5, 0));
  }
}

template <ColourOrder kOrder>
void CompareColoursWithTheNaivePicture() {
  Random random(11);
  for (int round = 0; round < 300; ++round) {
    const int width = random.Between(1, 180);
    const int height = random.Between(1, 180);
    // The frame must not be smaller than the request in both dimensions: the factor would be 0.
    const int cx = random.Between(1, width);
    const int cy = random.Between(1, 200);
    const auto values = static_cast<Values>(random.Between(0, static_cast<int>(Values::kCount) - 1));
    NaiveFrame<NaiveColour> frame{width, height, {}};
    for (int i = 0; i < width * height; ++i) {
      frame.values.push_back({random.Value<std::uint8_t>(values, false),
                              random.Value<std::uint8_t>(values, false),
                              random.Value<std::uint8_t>(values, false)});
    }
    using Pixel = ColourPixel<kOrder>;
    const auto [pixelStride, rowStride] = RandomStrides<Pixel>(random, width);
    const auto stored = Store<Pixel>(frame, pixelStride, rowStride, 0, [](const NaiveColour& rgb) {
      return kOrder == ColourOrder::kRedFirst ? Pixel{{rgb[0], rgb[1], rgb[2]}}
                                              : Pixel{{rgb[2], rgb[1], rgb[0]}};
    });
    ASSERT_EQ(TakeBitmap(RenderColourThumbnail<kOrder>(stored.view(), {cx, cy})),
              Testing::NaiveColourThumbnail(frame, cx, cy))
        << width << " x " << height << " requested as " << cx << " x " << cy;
  }
}

TEST(ColourThumbnail, RedFirstEqualsTheNaivePicture) {
  CompareColoursWithTheNaivePicture<ColourOrder::kRedFirst>();
}
TEST(ColourThumbnail, BlueFirstEqualsTheNaivePicture) {
  CompareColoursWithTheNaivePicture<ColourOrder::kBlueFirst>();
}

TEST(ColourThumbnail, IsBlueFirstAndNotStretched) {
  StoredFrame<ColourPixel<ColourOrder::kRedFirst>> red(1, 1, 3, 3, 0);
  red.Set(0, 0, {{200, 100, 50}});
  StoredFrame<ColourPixel<ColourOrder::kBlueFirst>> blue(1, 1, 3, 3, 0);
  blue.Set(0, 0, {{50, 100, 200}});
  const std::vector<std::uint8_t> expected{50, 100, 200};
  const auto fromRed = TakeBitmap(RenderColourThumbnail<ColourOrder::kRedFirst>(red.view(), {1, 1}));
  EXPECT_EQ(fromRed.bytes, expected);
  EXPECT_EQ(fromRed.bits, 24);
  EXPECT_TRUE(fromRed.colours.empty());
  EXPECT_EQ(TakeBitmap(RenderColourThumbnail<ColourOrder::kBlueFirst>(blue.view(), {1, 1})).bytes, expected);
}

TEST(ColourThumbnail, DownsampleBoxRgbSwapsOnlyRedFirstPixels) {
  StoredFrame<RgbPixel> red(3, 2, 3, 9, 0);
  StoredFrame<BgrPixel> blue(3, 2, 3, 9, 0);
  for (int y = 0; y < 2; ++y) {
    red.Set(0, y, {{10, 20, 30}});
    red.Set(1, y, {{20, 40, 61}});
    blue.Set(0, y, {{30, 20, 10}});
    blue.Set(1, y, {{61, 40, 20}});
  }
  const std::vector<std::uint8_t> expected{45, 30, 15};
  std::vector<std::uint8_t> bits(3);
  const ImageView<std::uint8_t> target{1, 1, bits.data(), 3, 4};
  DownsampleBoxRgb(red.view(), 2, target);
  EXPECT_EQ(bits, expected);
  bits.assign(3, 0);
  DownsampleBoxRgb(blue.view(), 2, target);
  EXPECT_EQ(bits, expected);
  DownsampleBoxRgb(red.view(), 0, target);
  EXPECT_EQ(bits, expected);
}

TEST(ColourThumbnail, AveragesTruncate) {
  StoredFrame<ColourPixel<ColourOrder::kBlueFirst>> stored(3, 3, 3, 9, 0);
  for (int i = 0; i < 9; ++i)
    stored.Set(i % 3, i / 3, {{static_cast<std::uint8_t>(i == 8 ? 200 : 100), 7, 9}});
  EXPECT_EQ(TakeBitmap(RenderColourThumbnail<ColourOrder::kBlueFirst>(stored.view(), {1, 1})).bytes,
            (std::vector<std::uint8_t>{111, 7, 9}));
}

TEST(ColourThumbnail, RowsArePaddedToFourBytes) {
  const StoredFrame<ColourPixel<ColourOrder::kRedFirst>> stored(3, 2, 3, 9, 0);
  const auto picture = TakeBitmap(RenderColourThumbnail<ColourOrder::kRedFirst>(stored.view(), {3, 2}));
  EXPECT_EQ(picture.rowBytes, 12);
}

TEST(ColourThumbnail, NegativeRequestHasNoBitmap) {
  const StoredFrame<ColourPixel<ColourOrder::kRedFirst>> stored(30, 20, 3, 90, 0);
  EXPECT_EQ(RenderColourThumbnail<ColourOrder::kRedFirst>(stored.view(), {-3, -3}), nullptr);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
