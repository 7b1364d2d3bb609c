// Compares random valid files of every kind and pixel type with the naive picture of their frame.
#include <gtest/gtest.h>

#include <algorithm>

#include "ebn_file.h"
#include "emi_file.h"
#include "image_file_info.h"
#include "mrc_file.h"
#include "naive_thumbnail.h"
#include "open_file.h"
#include "random_values.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

// Colour pixels of both byte orders in a file. As values, both are red, green, blue.
struct RedFirst : NaiveColour {};
struct BlueFirst : NaiveColour {};

template <class T>
struct Writer {
  static T Random(Testing::Random& random, Values values, bool first) {
    return random.Value<T>(values, first);
  }
  static std::string Bytes(T value, ByteOrder order) { return BytesOf({value}, order); }
};
template <class T>
struct Writer<NaiveComplex<T>> {
  static NaiveComplex<T> Random(Testing::Random& random, Values values, bool first) {
    return {random.Value<T>(values, first), random.Value<T>(values, first)};
  }
  static std::string Bytes(NaiveComplex<T> value, ByteOrder) { return BytesOf({value.re, value.im}); }
};
template <>
struct Writer<RedFirst> {
  static RedFirst Random(Testing::Random& random, Values values, bool first) {
    const auto channel = [&] { return random.Value<std::uint8_t>(values, first); };
    return {{channel(), channel(), channel()}};
  }
  static std::string Bytes(RedFirst value, ByteOrder) { return BytesOf({value[0], value[1], value[2]}); }
};
template <>
struct Writer<BlueFirst> {
  static BlueFirst Random(Testing::Random& random, Values values, bool first) {
    return {Writer<RedFirst>::Random(random, values, first)};
  }
  static std::string Bytes(BlueFirst value, ByteOrder) { return BytesOf({value[2], value[1], value[0]}); }
};

template <class T>
NaiveFrame<T> RandomFrame(Random& random) {
  NaiveFrame<T> frame{random.Between(1, 60), random.Between(1, 60), {}};
  const auto values = static_cast<Values>(random.Between(0, static_cast<int>(Values::kCount) - 1));
  for (int i = 0; i < frame.width * frame.height; ++i) {
    frame.values.push_back(Writer<T>::Random(random, values, i == 0));
  }
  return frame;
}

template <class T>
std::string PixelBytes(const NaiveFrame<T>& frame, ByteOrder order = ByteOrder::kLittleEndian) {
  std::string bytes;
  for (const T& value : frame.values) bytes += Writer<T>::Bytes(value, order);
  return bytes;
}

template <class T>
BitmapPixels NaivePicture(const NaiveFrame<T>& frame, int cx, int cy) {
  return NaiveGreyThumbnail(frame, cx, cy);
}
template <class T>
BitmapPixels NaivePicture(const NaiveFrame<NaiveComplex<T>>& frame, int cx, int cy) {
  return NaiveComplexThumbnail(frame, cx, cy);
}
template <class Colour>
  requires std::is_base_of_v<NaiveColour, Colour>
BitmapPixels NaivePicture(const NaiveFrame<Colour>& frame, int cx, int cy) {
  return NaiveColourThumbnail({frame.width, frame.height, {frame.values.begin(), frame.values.end()}}, cx,
                              cy);
}

std::string Noise(Random& random, int most) {
  std::string noise(static_cast<std::size_t>(random.Between(0, most)), '\0');
  for (char& byte : noise) byte = static_cast<char>(random.Bits());
  return noise;
}

template <class Reader, class T>
void ExpectPicture(Random& random, const OpenFile<Reader>& file, const NaiveFrame<T>& frame) {
  ASSERT_TRUE(file->IsValid());
  EXPECT_EQ(file->GetDimensions(), (Size2{frame.width, frame.height}));
  for (int i = 0; i < 3; ++i) {
    const int cx = random.Between(1, frame.width);  // a colour frame must not be smaller than the request
    const int cy = random.Between(1, 80);
    ASSERT_EQ(file.Thumbnail({cx, cy}), NaivePicture(frame, cx, cy))
        << frame.width << " x " << frame.height << " requested as " << cx << " x " << cy;
  }
}

constexpr int kRounds = 60;

// The parameter of a test that runs once for every pixel type: the type, and its number in the file kind.
template <class T, int kNumber>
struct TypeCode {
  using Pixel = T;
  static constexpr int kCode = kNumber;
};

template <class T>
class RandomMrc : public testing::Test {};
using MrcTypes =
    testing::Types<TypeCode<std::uint8_t, 0>, TypeCode<std::int16_t, 1>, TypeCode<float, 2>,
                   TypeCode<NaiveComplex<std::int16_t>, 3>, TypeCode<NaiveComplex<float>, 4>,
                   TypeCode<std::uint16_t, 6>, TypeCode<std::uint8_t, 11>, TypeCode<RedFirst, 16>>;
TYPED_TEST_SUITE(RandomMrc, MrcTypes);

TYPED_TEST(RandomMrc, EqualsTheNaivePicture) {
  using T = typename TypeParam::Pixel;
  Random random(TypeParam::kCode);
  for (int round = 0; round < kRounds && !this->HasFatalFailure(); ++round) {
    const NaiveFrame<T> frame = RandomFrame<T>(random);
    NaiveFrame<T> stored = frame;  // the bottom row first
    for (int y = 0; y < frame.height; ++y) {
      std::copy_n(frame.values.begin() + y * frame.width, frame.width,
                  stored.values.begin() + (frame.height - 1 - y) * frame.width);
    }
    MrcFile file;
    file.nx = frame.width;
    file.ny = frame.height;
    file.nz = random.Between(1, 6);
    file.mode = TypeParam::kCode;
    file.order = random.OneIn(2) ? ByteOrder::kLittleEndian : ByteOrder::kBigEndian;
    file.extendedHeader = Noise(random, 300);
    const std::string pixels = PixelBytes(stored, sizeof(T) == 2 ? file.order : ByteOrder::kLittleEndian);
    for (int section = 0; section < file.nz; ++section) {
      file.pixels += section == file.nz / 2 ? pixels : std::string(pixels.size(), static_cast<char>(section));
    }
    ExpectPicture(random, OpenFile<MrcFileInfo>(file, std::wstring(L"mrc")), frame);
  }
}

template <class T>
class RandomEbn : public testing::Test {};
using EbnTypes =
    testing::Types<TypeCode<std::uint8_t, 1>, TypeCode<std::uint16_t, 2>, TypeCode<std::uint32_t, 3>,
                   TypeCode<std::int8_t, 4>, TypeCode<std::int16_t, 5>, TypeCode<std::int32_t, 6>,
                   TypeCode<float, 7>, TypeCode<double, 8>>;
TYPED_TEST_SUITE(RandomEbn, EbnTypes);

TYPED_TEST(RandomEbn, EqualsTheNaivePicture) {
  using T = typename TypeParam::Pixel;
  Random random(TypeParam::kCode);
  for (int round = 0; round < kRounds && !this->HasFatalFailure(); ++round) {
    const NaiveFrame<T> frame = RandomFrame<T>(random);
    EbnFile file;
    file.typeCode = TypeParam::kCode;
    file.width = frame.width;
    file.height = frame.height;
    file.afterHeader = Noise(random, 50);
    file.dataOffset += static_cast<std::int32_t>(file.afterHeader.size());
    file.afterHeader += PixelBytes(frame) + Noise(random, 50);
    ExpectPicture(random, OpenFile<EbnFileInfo>(file), frame);
  }
}

template <class T>
class RandomSer : public testing::Test {};
using SerTypes =
    testing::Types<TypeCode<std::uint8_t, 1>, TypeCode<std::uint16_t, 2>, TypeCode<std::uint32_t, 3>,
                   TypeCode<std::int8_t, 4>, TypeCode<std::int16_t, 5>, TypeCode<std::int32_t, 6>,
                   TypeCode<float, 7>, TypeCode<double, 8>, TypeCode<NaiveComplex<float>, 9>,
                   TypeCode<NaiveComplex<double>, 10>>;
TYPED_TEST_SUITE(RandomSer, SerTypes);

TYPED_TEST(RandomSer, EqualsTheNaivePicture) {
  using T = typename TypeParam::Pixel;
  Random random(TypeParam::kCode);
  for (int round = 0; round < kRounds && !this->HasFatalFailure(); ++round) {
    const NaiveFrame<T> frame = RandomFrame<T>(random);
    SerFile file;
    file.version = random.OneIn(2) ? 0x0210 : 0x0220;
    file.tagTypeId = random.OneIn(2) ? 0x4152 : 0x4142;
    file.dimensions.resize(static_cast<std::size_t>(random.Between(0, 3)));
    for (auto& dimension : file.dimensions) dimension.units = Noise(random, 30);
    file.elements.resize(static_cast<std::size_t>(random.Between(1, 4)));
    file.elements[0].typeCode = TypeParam::kCode;
    file.elements[0].width = static_cast<std::uint32_t>(frame.width);
    file.elements[0].height = static_cast<std::uint32_t>(frame.height);
    file.elements[0].pixels = PixelBytes(frame);
    ExpectPicture(random, OpenFile<SerFileInfo>(file), frame);
  }
}

template <class T>
class RandomEmi : public testing::Test {};
using EmiTypes =
    testing::Types<TypeCode<std::int8_t, 0x2200>, TypeCode<std::uint8_t, 0x2202>,
                   TypeCode<std::int16_t, 0x2204>, TypeCode<std::uint16_t, 0x2206>,
                   TypeCode<std::int32_t, 0x2208>, TypeCode<std::uint32_t, 0x220A>, TypeCode<float, 0x220C>,
                   TypeCode<double, 0x220E>, TypeCode<NaiveComplex<double>, 0x2212>,
                   TypeCode<NaiveComplex<float>, 0x2214>>;
TYPED_TEST_SUITE(RandomEmi, EmiTypes);

/// Returns random items that the reader ignores anywhere below an object.
std::string RandomItems(Random& random, int most) {
  std::string items;
  for (int i = random.Between(0, most); i > 0; --i) {
    const auto tag = static_cast<std::uint16_t>(random.Bits());
    switch (random.Between(0, 5)) {
      case 0: items += EmiScalar(0x0031, tag, "1234"); break;
      case 1: items += EmiText(tag, Noise(random, 30)); break;
      case 2: items += EmiArray(0x2060, tag, Noise(random, 800)); break;
      case 3: items += EmiPixelArray(0x2201, 1, 1, Noise(random, 9)); break;
      case 4: items += EmiStructure(0x4102, 0x0300, EmiStructure(0x4100, 1, EmiDouble(tag, 1.5))); break;
      default: items += EmiStructure(0x4000, tag, RandomItems(random, most - 1)); break;
    }
  }
  return items;
}

TYPED_TEST(RandomEmi, EqualsTheNaivePicture) {
  using T = typename TypeParam::Pixel;
  Random random(TypeParam::kCode);
  for (int round = 0; round < kRounds && !this->HasFatalFailure(); ++round) {
    const NaiveFrame<T> frame = RandomFrame<T>(random);
    const std::string picture =
        EmiPixelArray(TypeParam::kCode, static_cast<std::uint32_t>(frame.width),
                      static_cast<std::uint32_t>(frame.height), PixelBytes(frame) + Noise(random, 20));
    const std::string image = EmiImageObject(RandomItems(random, 4) + picture + RandomItems(random, 4));
    const std::string another = EmiImageObject(EmiPixelArray(0x2202, 1, 1, "x"));
    EmiFile file;
    file.items = EmiStructure(0x4000, 1, RandomItems(random, 4) + image + (random.OneIn(2) ? another : ""));
    ExpectPicture(random, OpenFile<EmiFileInfo>(file), frame);
  }
}

template <class T>
class RandomRaw : public testing::Test {};
using RawTypes =
    testing::Types<TypeCode<std::uint8_t, 0>, TypeCode<std::uint16_t, 1>, TypeCode<std::uint32_t, 2>,
                   TypeCode<std::int8_t, 4>, TypeCode<std::int16_t, 5>, TypeCode<std::int32_t, 6>,
                   TypeCode<float, 8>, TypeCode<double, 9>, TypeCode<NaiveComplex<float>, 10>,
                   TypeCode<NaiveComplex<double>, 13>, TypeCode<RedFirst, 16>, TypeCode<BlueFirst, 18>>;
TYPED_TEST_SUITE(RandomRaw, RawTypes);

/// Spreads the pixels of a packed file. Random gaps separate pixels, rows or columns and precede the first
/// pixel. Each direction may be reversed, and rows and columns may be exchanged.
void Spread(Random& random, RawFile& file) {
  const std::int32_t pixelBytes = file.pixelStride;
  const bool byColumn = random.OneIn(2);
  std::int32_t& inner = byColumn ? file.rowStride : file.pixelStride;
  std::int32_t& outer = byColumn ? file.pixelStride : file.rowStride;
  inner = pixelBytes + (random.OneIn(2) ? random.Between(0, 9) : 0);
  outer = inner * (byColumn ? file.height : file.width) + (random.OneIn(2) ? random.Between(0, 99) : 0);
  if (random.OneIn(2)) inner = -inner;
  if (random.OneIn(2)) outer = -outer;
  const std::int32_t right = (file.width - 1) * file.pixelStride;
  const std::int32_t down = (file.height - 1) * file.rowStride;
  file.offset = random.Between(0, 30) - std::min(right, 0) - std::min(down, 0);

  const std::string packed = file.pixels;
  const std::int32_t fileBytes = file.offset + std::max(right, 0) + std::max(down, 0) + pixelBytes;
  file.pixels.assign(static_cast<std::size_t>(fileBytes), '\xAA');
  for (std::int32_t y = 0; y < file.height; ++y) {
    for (std::int32_t x = 0; x < file.width; ++x) {
      std::copy_n(packed.begin() + (y * file.width + x) * pixelBytes, pixelBytes,
                  file.pixels.begin() + file.offset + x * file.pixelStride + y * file.rowStride);
    }
  }
}

TYPED_TEST(RandomRaw, EqualsTheNaivePicture) {
  using T = typename TypeParam::Pixel;
  Random random(TypeParam::kCode);
  for (int round = 0; round < kRounds && !this->HasFatalFailure(); ++round) {
    const NaiveFrame<T> frame = RandomFrame<T>(random);
    RawFile file = PackedRawFile(DataType{TypeParam::kCode}, frame.width, frame.height, PixelBytes(frame));
    if (!random.OneIn(3)) Spread(random, file);
    if (random.OneIn(2)) file.pixels += Noise(random, 40);
    ExpectPicture(random, OpenFile<RawFileInfo>(file), frame);
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
