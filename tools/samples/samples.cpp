#include "samples.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <utility>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "scenes.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt::Samples {
namespace {

using namespace Testing;

/// Converts the value v of a pixel to offset + scale * v in another type. Integers are rounded and clamped to
/// their range.
template <class Number>
Number AsNumber(double v, double scale, double offset) {
  const double number = offset + scale * v;
  if constexpr (std::is_integral_v<Number>) {
    return static_cast<Number>(std::clamp(std::floor(number + 0.5),
                                          static_cast<double>(std::numeric_limits<Number>::min()),
                                          static_cast<double>(std::numeric_limits<Number>::max())));
  } else {
    return static_cast<Number>(number);
  }
}

/// Returns the rows without padding, top row first.
template <class Number>
std::string Pixels(const Picture& picture, double scale, double offset = 0) {
  FileBytes bytes;
  for (const double v : picture.values()) bytes.Put(AsNumber<Number>(v, scale, offset));
  return bytes.bytes();
}

/// Returns the pixels, with 1 instead of a real part of 0: the logarithm of a single 0 would make the whole
/// thumbnail black.
template <class Number>
std::string ComplexPixels(const ComplexPicture& picture) {
  FileBytes bytes;
  for (std::size_t i = 0; i < picture.real.values().size(); ++i) {
    const auto real = AsNumber<Number>(picture.real.values()[i], 1, 0);
    bytes.Put(real == 0 ? Number{1} : real);
    bytes.Put(AsNumber<Number>(picture.imaginary.values()[i], 1, 0));
  }
  return bytes.bytes();
}

/// Returns three bytes for each pixel, in the order of the arguments.
std::string ColourPixels(const Picture& first, const Picture& second, const Picture& third) {
  FileBytes bytes;
  for (std::size_t i = 0; i < first.values().size(); ++i) {
    for (const Picture* map : {&first, &second, &third}) {
      bytes.Put(AsNumber<std::uint8_t>(map->values()[i], 255, 0));
    }
  }
  return bytes.bytes();
}

/// Returns the picture with its rows in reverse order, because MRC files store the bottom row first.
Picture BottomUp(const Picture& picture) {
  Picture flipped(picture.width(), picture.height());
  flipped.Fill([&](int x, int y) { return picture.At(x, picture.height() - 1 - y); });
  return flipped;
}

MrcFile MrcOf(const Picture& picture, std::int32_t mode, std::string pixels,
              std::vector<std::string> labels) {
  MrcFile file;
  file.nx = picture.width();
  file.ny = picture.height();
  file.mode = mode;
  file.labels = std::move(labels);
  file.pixels = std::move(pixels);
  return file;
}

std::string MrcMicrograph() {
  const Picture picture = BottomUp(Micrograph(640, 640, 1));
  return MrcOf(picture, 1, Pixels<std::int16_t>(picture, 6000, -500),
               {"Particles in ice, defocus 1.8 um", "Sum of 40 frames, 1.06 A per pixel"})
      .Bytes();
}

std::string MrcAtlas() {
  const Picture picture = BottomUp(GridAtlas(448, 448, 2));
  return MrcOf(picture, 0, Pixels<std::uint8_t>(picture, 250), {"Grid 3, atlas at 105 x"}).Bytes();
}

std::string MrcCounts() {
  const Picture picture = BottomUp(CountedFrame(384, 384, 3));
  return MrcOf(picture, 6, Pixels<std::uint16_t>(picture, 1), {"Counted electrons, one second"}).Bytes();
}

std::string MrcAverage() {
  const Picture picture = BottomUp(ClassAverage(256, 256, 4));
  return MrcOf(picture, 2, Pixels<float>(picture, 4, -2), {"Class 7 of 50, 3214 particles"}).Bytes();
}

std::string MrcTransform() {
  const ComplexPicture transform = Transform(256, 256, 5);
  return MrcOf(transform.real, 4, ComplexPixels<float>(transform), {"Transform of a micrograph"}).Bytes();
}

std::string MrcIntegerTransform() {
  const ComplexPicture transform = Transform(256, 256, 6);
  return MrcOf(transform.real, 3, ComplexPixels<std::int16_t>(transform), {"Transform in integers"}).Bytes();
}

std::string MrcColour() {
  const ElementMaps maps = ElementMap(384, 320, 7);
  return MrcOf(maps.red, 16, ColourPixels(BottomUp(maps.red), BottomUp(maps.green), BottomUp(maps.blue)),
               {"Red: Co  Green: O  Blue: Pt"})
      .Bytes();
}

std::string MrcBigEndian() {
  const Picture picture = BottomUp(Nanoparticles(320, 320, 8));
  MrcFile file = MrcOf(picture, 1, {}, {"Written by a workstation of the other byte order"});
  file.order = ByteOrder::kBigEndian;
  FileBytes pixels(ByteOrder::kBigEndian);
  for (const double v : picture.values()) pixels.Put(AsNumber<std::int16_t>(v, 12000, 0));
  file.pixels = pixels.bytes();
  return file.Bytes();
}

std::string MrcDamaged() {
  const Picture picture(256, 256, 0.5);
  return MrcOf(picture, 99, Pixels<std::uint8_t>(picture, 255), {"Nobody knows mode 99"}).Bytes();
}

std::string MrcTruncated() {
  const std::string bytes = MrcMicrograph();
  return bytes.substr(0, bytes.size() / 8);
}

std::string AliTiltSeries() {
  constexpr int kViews = 11;
  constexpr int kUntilted = kViews / 2;
  std::string pixels;
  for (int view = 0; view < kViews; ++view) {
    const double tilt = (view - kUntilted) / (kViews / 2.0) * 0.9;
    pixels += Pixels<std::uint8_t>(BottomUp(TiltedView(256, 256, tilt, 9)), 255);
  }
  MrcFile file =
      MrcOf(Picture(256, 256), 0, pixels, {"Aligned tilt series, -60 to 60 degrees", "Fiducials: 16"});
  file.nz = kViews;
  return file.Bytes();
}

std::string RecTomogram() {
  constexpr int kSections = 7;
  std::string pixels;
  for (int section = 0; section < kSections; ++section) {
    const Picture picture = TomogramSection(224, 224, (section + 0.5) / kSections, 10);
    pixels += Pixels<std::int16_t>(BottomUp(picture), 8000, -4000);
  }
  MrcFile file = MrcOf(Picture(224, 224), 1, pixels, {"Reconstruction, binned by 4"});
  file.nz = kSections;
  file.extendedHeader = std::string(512, '\0');
  return file.Bytes();
}

SerElement SerImage(const Picture& picture, std::int16_t typeCode, std::string pixels) {
  SerElement element;
  element.calibrationX.delta = element.calibrationY.delta = 1.2e-9;
  element.typeCode = typeCode;
  element.width = static_cast<std::uint32_t>(picture.width());
  element.height = static_cast<std::uint32_t>(picture.height());
  element.pixels = std::move(pixels);
  return element;
}

std::string SerDiffraction() {
  const Picture picture = DiffractionPattern(480, 480, 11);
  SerFile file;
  file.elements = {SerImage(picture, 2, Pixels<std::uint16_t>(picture, 4000))};
  return file.Bytes();
}

std::string SerSpectrum() {
  const Picture picture = SpectrumImage(512, 192, 12);
  SerFile file;
  file.version = 0x0220;
  file.elements = {SerImage(picture, 6, Pixels<std::int32_t>(picture, 100))};
  return file.Bytes();
}

std::string SerFocusSeries() {
  SerFile file;
  file.tagTypeId = 0x4142;
  file.dimensions.front().size = 3;
  file.dimensions.front().units = "um";
  for (std::uint64_t i = 0; i < 3; ++i) {
    const Picture picture = Nanoparticles(160, 160, 13);
    const ComplexPicture transform = Transform(160, 160, 13 + i);
    file.elements.push_back(i == 0 ? SerImage(picture, 7, Pixels<float>(picture, 1))
                                   : SerImage(picture, 9, ComplexPixels<float>(transform)));
  }
  return file.Bytes();
}

std::string SerDamaged() {
  SerFile file;
  file.elements = {SerImage(Picture(1, 1), 1, std::string(1, '\0'))};
  file.seriesId = 0x0198;
  return file.Bytes();
}

std::string EmiAtoms() {
  const Picture picture = AtomLattice(320, 320, 14);
  const auto side = static_cast<std::uint32_t>(picture.width());
  EmiFile file;
  const std::string scale =
      EmiStructure(0x4102, 0x0300, EmiDouble(0x0120, 0.042e-9) + EmiDouble(0x0130, 0.042e-9));
  file.items = EmiImageObject(EmiText(0x0100, "HAADF") + EmiText(0x0419, "Grain boundary") + scale +
                              EmiPixelArray(0x220C, side, side, Pixels<float>(picture, 30000, 1500))) +
               EmiEnd();
  return file.Bytes();
}

std::string EmiTransform() {
  const ComplexPicture transform = Transform(160, 160, 15);
  return OneImageEmiFile(0x2212, 160, 160, ComplexPixels<double>(transform)).Bytes();
}

std::string EmiDamaged() {
  EmiFile file;
  file.items = EmiText(0x0100, "A text outside of every object") + EmiEnd();
  return file.Bytes();
}

EbnFile EbnOf(const Picture& picture, std::uint16_t typeCode, std::string pixels) {
  EbnFile file;
  file.typeCode = typeCode;
  file.width = picture.width();
  file.height = picture.height();
  file.model = 2;
  file.source = 1;
  file.lens = 4;
  file.dNumber = 3415;
  file.kilovolts = 300;
  file.afterHeader = std::move(pixels);
  return file;
}

std::string EbnExposure() {
  const Picture picture = Nanoparticles(448, 336, 16);
  return EbnOf(picture, 2, Pixels<std::uint16_t>(picture, 20000, 300)).Bytes();
}

std::string EbnGainReference() {
  Picture picture(192, 192, 1);
  Random random(17);
  picture.AddClouds(random, 90, 0.03);
  picture.AddClouds(random, 8, 0.01);
  picture.Fill([&](int x, int y) {
    const bool seam = x % 48 == 0 || y % 96 == 0;  // the detector consists of tiles
    return picture.At(x, y) + (seam ? 0.03 : 0) + 0.01 * ((x / 48 + y / 96) % 2);
  });
  EbnFile file = EbnOf(picture, 8, Pixels<double>(picture, 1));
  file.model = 1;
  file.source = -1.6;
  file.dNumber = 0;
  file.kilovolts = 200;
  return file.Bytes();
}

std::string EbnTruncated() {
  const std::string bytes = EbnExposure();
  return bytes.substr(0, bytes.size() / 2);
}

std::string RawUnsigned() {
  const Picture picture = AtomLattice(512, 320, 18);
  return PackedRawFile(DataType::kUInt16, 512, 320, Pixels<std::uint16_t>(picture, 9000, 200)).Bytes();
}

std::string RawBottomUp() {
  const Picture picture = ClassAverage(320, 320, 19);
  RawFile file =
      PackedRawFile(DataType::kInt32, 320, 320, Pixels<std::int32_t>(BottomUp(picture), 1e6, -5e5));
  file.offset = (file.height - 1) * file.rowStride;
  file.rowStride = -file.rowStride;
  return file.Bytes();
}

std::string RawPadded() {
  const Picture picture = TomogramSection(301, 256, 0.5, 20);
  RawFile file = PackedRawFile(DataType::kInt8, 301, 256, {});
  file.rowStride = 304;
  FileBytes pixels;
  for (int y = 0; y < picture.height(); ++y) {
    for (int x = 0; x < picture.width(); ++x) pixels.Put(AsNumber<std::int8_t>(picture.At(x, y), 250, -120));
    pixels.Text(std::string(3, '\0'));
  }
  file.pixels = pixels.bytes();
  return file.Bytes();
}

std::string RawInterleaved() {
  // The pixels of two detectors alternate. The header describes the image of the first one.
  const Picture shown = GridAtlas(256, 256, 21);
  const Picture other = Nanoparticles(256, 256, 22);
  RawFile file = PackedRawFile(DataType::kUInt32, 256, 256, {});
  file.pixelStride = 8;
  file.rowStride = 256 * file.pixelStride;
  FileBytes pixels;
  for (std::size_t i = 0; i < shown.values().size(); ++i) {
    pixels.Put(AsNumber<std::uint32_t>(shown.values()[i], 1e6, 0));
    pixels.Put(AsNumber<std::uint32_t>(other.values()[i], 1e6, 0));
  }
  file.pixels = pixels.bytes();
  return file.Bytes();
}

std::string RawColour(DataType type) {
  const bool redFirst = type == DataType::kRgb24;
  const ElementMaps maps = ElementMap(320, 272, redFirst ? 23 : 24);
  const Picture& first = redFirst ? maps.red : maps.blue;
  const Picture& third = redFirst ? maps.blue : maps.red;
  return PackedRawFile(type, 320, 272, ColourPixels(first, maps.green, third)).Bytes();
}

std::string RawRgb() {
  return RawColour(DataType::kRgb24);
}

std::string RawBgr() {
  return RawColour(DataType::kBgr24);
}

std::string RawTransform() {
  const ComplexPicture transform = Transform(192, 192, 25);
  return PackedRawFile(DataType::kComplexFloat32, 192, 192, ComplexPixels<float>(transform)).Bytes();
}

}  // namespace

const std::vector<Sample>& AllSamples() {
  static const std::vector<Sample> samples = {
      {"atlas.mrc", MrcAtlas},
      {"atoms.emi", EmiAtoms},
      {"atoms.raw", RawUnsigned},
      {"average.mrc", MrcAverage},
      {"big-endian.mrc", MrcBigEndian},
      {"bottom-up.raw", RawBottomUp},
      {"counted frame.mrc", MrcCounts},
      {"damaged.emi", EmiDamaged},
      {"damaged.mrc", MrcDamaged},
      {"damaged.ser", SerDamaged},
      {"diffraction.ser", SerDiffraction},
      {"elements bgr.raw", RawBgr},
      {"elements rgb.raw", RawRgb},
      {"elements.mrc", MrcColour},
      {"exposure.ebn", EbnExposure},
      {"focus series.ser", SerFocusSeries},
      {"gain reference.ebn", EbnGainReference},
      {"interleaved.raw", RawInterleaved},
      {"micrograph.mrc", MrcMicrograph},
      {"padded rows.raw", RawPadded},
      {"spectrum image.ser", SerSpectrum},
      {"tilt series.ali", AliTiltSeries},
      {"tomogram.rec", RecTomogram},
      {"transform integer.mrc", MrcIntegerTransform},
      {"transform.emi", EmiTransform},
      {"transform.mrc", MrcTransform},
      {"transform.raw", RawTransform},
      {"truncated.ebn", EbnTruncated},
      {"truncated.mrc", MrcTruncated},
  };
  return samples;
}

}  // namespace Qel::Lumetra::ShellExt::Samples
