#include "sample_files.h"

#include <cstdint>
#include <stdexcept>
#include <utility>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

// The frame of most samples: not square, no powers of two, and small, because every file is read thousands of
// times.
constexpr std::int32_t kWidth = 7;
constexpr std::int32_t kHeight = 5;
constexpr std::int32_t kPixels = kWidth * kHeight;

/// Returns `count` bytes, of which no two neighbours are equal.
std::string Pattern(std::int32_t count) {
  std::string bytes;
  for (std::int32_t i = 0; i < count; ++i) bytes += static_cast<char>(i * 37 % 251);
  return bytes;
}

/// Bytes per pixel by the type codes of .ebn and .ser files, which count from 1.
constexpr std::int32_t kBytesOfTypeCode[] = {0, 1, 2, 4, 1, 2, 4, 4, 8, 8, 16};

class Samples {
 public:
  void Add(std::string name, std::string bytes) { files_.push_back({std::move(name), std::move(bytes)}); }
  std::vector<SampleFile> Take() { return std::move(files_); }

 private:
  std::vector<SampleFile> files_;
};

std::string WithNumber(const char* text, int number) {
  return text + std::to_string(number);
}

MrcFile Mrc(std::int32_t nx, std::int32_t ny, std::int32_t nz, std::int32_t mode, std::int32_t pixelBytes) {
  MrcFile file;
  file.nx = nx;
  file.ny = ny;
  file.nz = nz;
  file.mode = mode;
  file.pixels = Pattern(nx * ny * nz * pixelBytes);
  return file;
}

std::vector<SampleFile> MrcSamples() {
  struct Mode {
    std::int32_t mode;
    std::int32_t pixelBytes;
  };
  // Unknown modes are read as bytes.
  constexpr Mode kModes[] = {{0, 1}, {1, 2}, {2, 4}, {3, 4}, {4, 8}, {6, 2}, {16, 3}, {5, 1}, {7, 1}};

  Samples samples;
  MrcFile file = Mrc(kWidth, kHeight, 3, 0, 1);
  file.labels = {"a label", "  another  "};
  file.extendedHeader = "extended";
  samples.Add("all_parts", file.Bytes());
  for (const Mode& mode : kModes) {
    file = Mrc(kWidth, kHeight, 1, mode.mode, mode.pixelBytes);
    samples.Add(WithNumber("mode_", mode.mode), file.Bytes());
    file.order = ByteOrder::kBigEndian;
    samples.Add(WithNumber("mode_", mode.mode) + "_swapped", file.Bytes());
  }
  file = Mrc(2, 2, 1, 0, 1);
  file.nlabl = 25;
  file.labels.assign(10, "\xB5 of a label");
  file.labels[3].assign(80, 'x');
  file.labels[4] = "    ";
  samples.Add("labels", file.Bytes());
  file = Mrc(4, 4, 5, 1, 2);
  file.order = ByteOrder::kBigEndian;
  file.extendedHeader = Pattern(128);
  samples.Add("stack_swapped", file.Bytes());
  samples.Add("large", Mrc(64, 48, 1, 2, 4).Bytes());
  return samples.Take();
}

constexpr DataType kDataTypes[] = {DataType::kUInt8,          DataType::kUInt16,  DataType::kUInt32,
                                   DataType::kInt8,           DataType::kInt16,   DataType::kInt32,
                                   DataType::kFloat32,        DataType::kFloat64, DataType::kComplexFloat32,
                                   DataType::kComplexFloat64, DataType::kRgb24,   DataType::kBgr24};

/// Returns the file with a header that says that the bottom row is stored first.
RawFile BottomUp(RawFile file) {
  file.offset = (file.height - 1) * file.rowStride;
  file.rowStride = -file.rowStride;
  return file;
}

std::vector<SampleFile> RawSamples() {
  Samples samples;
  RawFile file = PackedRawFile(DataType::kUInt8, 4, 3, Pattern(24));
  file.offset = 2;
  samples.Add("all_parts", file.Bytes());
  for (const DataType type : kDataTypes) {
    const std::int32_t pixelBytes = BitsPerPixel(type) / 8;
    const RawFile packed = PackedRawFile(type, kWidth, kHeight, Pattern(kPixels * pixelBytes));
    samples.Add(WithNumber("packed_", static_cast<int>(type)), packed.Bytes());
    samples.Add(WithNumber("bottom_up_", static_cast<int>(type)), BottomUp(packed).Bytes());
  }
  file = PackedRawFile(DataType::kUInt16, kWidth, kHeight, Pattern(kHeight * 32));
  file.rowStride = 32;
  samples.Add("padded", file.Bytes());
  file = PackedRawFile(DataType::kUInt8, kWidth, kHeight, Pattern(3 * kPixels));
  file.pixelStride = 3;
  file.rowStride = 3 * kWidth;
  samples.Add("interleaved", file.Bytes());
  file = PackedRawFile(DataType::kFloat32, kWidth, kHeight, Pattern(4 * kPixels));
  file.offset = 4 * (kWidth - 1);
  file.pixelStride = -4;
  samples.Add("right_to_left", file.Bytes());
  file = PackedRawFile(DataType::kInt16, kWidth, kHeight, Pattern(2 * kPixels));
  file.pixelStride = 2 * kHeight;
  file.rowStride = 2;
  samples.Add("by_columns", file.Bytes());
  file = PackedRawFile(DataType::kUInt32, kWidth, kHeight, Pattern(4));
  file.pixelStride = 0;
  file.rowStride = 0;
  samples.Add("one_value", file.Bytes());
  samples.Add("large", PackedRawFile(DataType::kRgb24, 64, 48, Pattern(64 * 48 * 3)).Bytes());
  return samples.Take();
}

/// Returns a file whose pixels directly follow the header.
EbnFile Ebn(std::uint16_t typeCode, std::int32_t width, std::int32_t height) {
  EbnFile file;
  file.typeCode = typeCode;
  file.width = width;
  file.height = height;
  file.afterHeader = Pattern(width * height * kBytesOfTypeCode[typeCode]);
  return file;
}

void SetInstrument(EbnFile& file, double number) {
  for (double* const field : {&file.model, &file.source, &file.lens, &file.dNumber, &file.kilovolts}) {
    *field = number;
  }
}

std::vector<SampleFile> EbnSamples() {
  Samples samples;
  EbnFile file = Ebn(1, 4, 3);
  SetInstrument(file, 2);
  samples.Add("all_parts", file.Bytes());
  for (std::uint16_t code = 1; code <= 8; ++code) {
    file = Ebn(code, kWidth, kHeight);
    samples.Add(WithNumber("type_", code), file.Bytes());
    file.dataOffset = 100;
    file.afterHeader.insert(0, Pattern(100 - 54));
    samples.Add(WithNumber("type_", code) + "_after_a_gap", file.Bytes());
  }
  int number = 0;
  for (const double code : {-4.0, -3.4, -2.5, -1.6, 0.5, 1.0, 3.4, 1e300}) {
    file = Ebn(1, 1, 1);
    SetInstrument(file, code);
    samples.Add(WithNumber("instrument_", number++), file.Bytes());
  }
  samples.Add("large", Ebn(5, 64, 48).Bytes());
  return samples.Take();
}

std::vector<SampleFile> EmiSamples() {
  struct ArrayType {
    std::uint16_t type;
    std::int32_t elementBytes;
  };
  constexpr ArrayType kTypes[] = {{0x2200, 1}, {0x2202, 1}, {0x2204, 2}, {0x2206, 2},  {0x2208, 4},
                                  {0x220A, 4}, {0x220C, 4}, {0x220E, 8}, {0x2212, 16}, {0x2214, 8}};
  const std::string pixels = EmiPixelArray(0x2202, 4, 3, Pattern(12));
  const std::string texts = EmiText(0x0100, "one") + EmiText(0x0419, "two") + EmiText(0x0400, "three") +
                            EmiText(0x0440, "four") + EmiText(0x0999, "");
  const std::string line =
      EmiLineDataObject(texts + EmiArray(0x210C, 0x0202, BytesOf({std::uint32_t{2}}) + Pattern(8)) +
                        EmiStructure(0x4100, 0x0300, EmiDouble(0x0100, 1.5) + EmiDouble(0x0120, 2.5)));
  const std::string image = EmiImageObject(
      texts + pixels + EmiStructure(0x4102, 0x0300, EmiDouble(0x0120, 1.5) + EmiDouble(0x0130, 2.5)));
  std::string numbers;
  for (const ArrayType number : {ArrayType{0x0010, 1}, ArrayType{0x0020, 1}, ArrayType{0x0070, 1},
                                 ArrayType{0x0030, 2}, ArrayType{0x0032, 2}, ArrayType{0x0031, 4},
                                 ArrayType{0x0033, 4}, ArrayType{0x0034, 8}, ArrayType{0x0040, 4}}) {
    numbers += EmiScalar(number.type, 0x0777, Pattern(number.elementBytes));
  }

  Samples samples;
  const auto add = [&samples](std::string name, const std::string& items) {
    EmiFile file;
    file.items = items;
    samples.Add(std::move(name), file.Bytes());
  };
  add("all_parts", numbers + line + image + EmiEnd());
  for (const ArrayType& array : kTypes) {
    const std::string name = WithNumber("type_", array.type & 0xFF);
    const std::string bytes = Pattern(kPixels * array.elementBytes);
    samples.Add(name, OneImageEmiFile(array.type, kWidth, kHeight, bytes).Bytes());
    EmiFile second = OneImageEmiFile(array.type, kWidth, kHeight, bytes);
    second.version = 0x0100;
    second.items = EmiStructure(0x4001, 0x0001, second.items + EmiImageObject(pixels)) + EmiEnd();
    samples.Add(name + "_and_another", second.Bytes());
  }
  add("without_end", image);
  add("unknown_array", EmiImageObject(pixels + EmiArray(0x2210, 0x0202, Pattern(20))) + EmiEnd());
  add("long_array", EmiArray(0x2345, 0x0001, Pattern(2000)) + image + EmiEnd());
  std::string deep = image;
  for (int i = 0; i < 50; ++i) deep = EmiStructure(0x4001, 0x0001, deep);
  add("deep", deep + EmiEnd());
  samples.Add("large", OneImageEmiFile(0x2206, 64, 48, Pattern(64 * 48 * 2)).Bytes());
  return samples.Take();
}

SerElement Element(std::int16_t typeCode, std::uint32_t width, std::uint32_t height) {
  SerElement element;
  element.typeCode = typeCode;
  element.width = width;
  element.height = height;
  element.pixels = Pattern(static_cast<std::int32_t>(width * height) * kBytesOfTypeCode[typeCode]);
  return element;
}

std::vector<SampleFile> SerSamples() {
  Samples samples;
  SerFile file;
  file.tagTypeId = 0x4142;
  file.dimensions.resize(2);
  file.dimensions[1].units = "s";
  file.elements = {Element(1, kWidth, kHeight), Element(2, kWidth, kHeight)};
  samples.Add("all_parts", file.Bytes());
  for (std::int16_t code = 1; code <= 10; ++code) {
    file = SerFile();
    file.elements = {Element(code, kWidth, kHeight)};
    samples.Add(WithNumber("type_", code), file.Bytes());
    file.version = 0x0220;
    samples.Add(WithNumber("type_", code) + "_wide", file.Bytes());
  }
  file.elements.assign(30, Element(1, kWidth, kHeight));
  samples.Add("many", file.Bytes());
  file.totalElements = 100;
  samples.Add("unfinished", file.Bytes());
  file = SerFile();
  file.elements = {Element(5, kWidth, kHeight)};
  file.dimensions[0].description = Pattern(700);
  file.dimensions[0].units = Pattern(600);
  samples.Add("long_texts", file.Bytes());
  file.dimensions.clear();
  samples.Add("without_dimensions", file.Bytes());
  file.elements = {Element(3, 64, 48)};
  samples.Add("large", file.Bytes());
  return samples.Take();
}

}  // namespace

std::vector<SampleFile> SampleFiles(std::string_view kind) {
  if (kind == "mrc") return MrcSamples();
  if (kind == "raw") return RawSamples();
  if (kind == "ebn") return EbnSamples();
  if (kind == "emi") return EmiSamples();
  if (kind == "ser") return SerSamples();
  throw std::invalid_argument("no samples of kind " + std::string(kind));
}

}  // namespace Qel::Lumetra::ShellExt::Testing
