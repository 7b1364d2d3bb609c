#include "ser_parser.h"

#include <algorithm>
#include <array>
#include <stdexcept>
#include <utility>

#include "byte_order.h"
#include "data_type.h"
#include "read_text.h"
#include "type_code.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::uint16_t kByteOrder = 0x4949;
constexpr std::uint16_t kSeriesId = 0x0197;
constexpr std::uint16_t kFirstVersion = 0x0210;
constexpr std::uint16_t kFirstWideVersion = 0x0220;  // the offset of the arrays has 64 bits
constexpr std::uint32_t kLines = 0x4120;
constexpr std::uint32_t kImages = 0x4122;
constexpr std::uint32_t kTimeTags = 0x4152;
constexpr std::uint32_t kPositionTags = 0x4142;

constexpr std::size_t kCalibrationBytes = 20;

SerCalibration LoadCalibration(const unsigned char* bytes) {
  return {.offset = LoadLittleEndian<double>(bytes),
          .delta = LoadLittleEndian<double>(bytes + 8),
          .element = LoadLittleEndian<std::int32_t>(bytes + 16)};
}

std::string ReadTextWithLength(std::istream& stream) {
  const auto length = ReadLittleEndian<std::int32_t>(stream);
  if (!stream.good()) return {};
  if (length < 0) throw std::length_error("negative SER text length");
  return ReadText(stream, static_cast<std::uint32_t>(length));
}

SerDimension ReadDimension(std::istream& stream) {
  std::array<unsigned char, sizeof(std::uint32_t) + kCalibrationBytes> bytes{};
  stream.read(reinterpret_cast<char*>(bytes.data()), bytes.size());
  return {.dimensionSize = LoadLittleEndian<std::uint32_t>(bytes.data()),
          .calibration = LoadCalibration(&bytes[sizeof(std::uint32_t)]),
          .description = ReadTextWithLength(stream),
          .units = ReadTextWithLength(stream)};
}

}  // namespace

SerParser::SerParser(std::istream& stream) : FileParser(stream) {
  frameCount_ = 0;
  const auto byteOrder = ReadLittleEndian<std::uint16_t>(stream);
  const auto seriesId = ReadLittleEndian<std::uint16_t>(stream);
  const auto seriesVersion = ReadLittleEndian<std::uint16_t>(stream);
  const auto dataTypeId = ReadLittleEndian<std::uint32_t>(stream);
  const auto tagTypeId = ReadLittleEndian<std::uint32_t>(stream);
  const auto totalElements = ReadLittleEndian<std::uint32_t>(stream);
  const auto validElements = ReadLittleEndian<std::uint32_t>(stream);
  // Only the low half of a wide offset is used, because all other offsets have 32 bits in every version.
  // Intentional.
  const auto arrayOffset = seriesVersion >= kFirstWideVersion
                               ? static_cast<std::uint32_t>(ReadLittleEndian<std::uint64_t>(stream))
                               : ReadLittleEndian<std::uint32_t>(stream);
  const auto dimensionCount = ReadLittleEndian<std::uint32_t>(stream);

  Require(byteOrder == kByteOrder, "byte order", byteOrder, "0x4949");
  Require(seriesId == kSeriesId, "series id", seriesId, "0x0197");
  Require(seriesVersion >= kFirstVersion, "series version", seriesVersion, "0x0210 or above");
  Require(validElements >= 1, "valid elements", validElements, "at least 1");
  Require(totalElements >= validElements, "total elements", totalElements,
          "at least the number of valid elements");
  // A fault found below need not reset this, because it fails the stream.
  isImageSeries_ = !fault() && dataTypeId == kImages;
  Require(dataTypeId == kLines || dataTypeId == kImages, "data type id", dataTypeId,
          "0x4122 (images) or 0x4120 (lines)");
  Require(tagTypeId == kTimeTags || tagTypeId == kPositionTags, "tag type id", tagTypeId,
          "0x4152 (times) or 0x4142 (positions)");
  if (fault()) {
    stream.setstate(std::ios_base::failbit);
    return;
  }
  if (!stream.good()) return;
  series_ = {
      .hasPositionTags = tagTypeId == kPositionTags, .dimensionCount = dimensionCount, .dimensions = {}};
  ReadDimensions();
  ReadElements(arrayOffset, validElements);
  Require(isImageSeries_, "The file contains a series of lines (data type id 0x4120), not of images.");
}

/// Reads the dimensions. A series that ends within them is not valid.
void SerParser::ReadDimensions() {
  for (std::uint32_t i = 0; i < series_->dimensionCount && stream().good(); ++i) {
    SerDimension dimension = ReadDimension(stream());
    if (stream().good() && i < kMaxDimensions) series_->dimensions.push_back(std::move(dimension));
  }
}

void SerParser::ReadElements(std::uint32_t arrayOffset, std::uint32_t count) {
  constexpr std::size_t kEntryBytes = sizeof(std::uint32_t);
  constexpr std::uint32_t kMaxEntries = 1024;  // in memory at a time

  // The offsets of the elements are followed by the same number of offsets of their tags, even if the header
  // has room for more elements than are valid. Intentional. The tags are not used, but their offsets must
  // exist, and reading their last byte proves that they do.
  stream().seekg(std::int64_t{arrayOffset} + 2 * std::int64_t{kEntryBytes} * count - 1);
  stream().get();

  frameCount_ = WrapToInt32(std::uint64_t{count});
  std::array<unsigned char, kMaxEntries * kEntryBytes> offsets;
  for (std::uint32_t done = 0; done < count && stream().good();) {
    const std::uint32_t entries = std::min(kMaxEntries, count - done);
    stream().seekg(arrayOffset + std::int64_t{kEntryBytes} * done);
    stream().read(reinterpret_cast<char*>(offsets.data()), std::streamsize{kEntryBytes} * entries);
    for (std::uint32_t i = 0; i < entries && stream().good(); ++i) {
      const auto offset = LoadLittleEndian<std::uint32_t>(&offsets[i * kEntryBytes]);
      const FrameLayout element = ReadElement(offset);
      if (done + i == 0) frame_ = element;
    }
    done += entries;
  }
}

FrameLayout SerParser::ReadElement(std::uint32_t position) {
  constexpr std::size_t kTypeCode = std::size_t{2} * kCalibrationBytes;
  constexpr std::size_t kSizeX = kTypeCode + sizeof(std::int16_t);
  constexpr std::size_t kSizeY = kSizeX + sizeof(std::uint32_t);
  constexpr std::size_t kBytes = kSizeY + sizeof(std::uint32_t);

  std::array<unsigned char, kBytes> bytes{};
  stream().seekg(position);
  stream().read(reinterpret_cast<char*>(bytes.data()), kBytes);
  const auto typeCode = LoadLittleEndian<std::int16_t>(&bytes[kTypeCode]);
  const auto type = DataTypeOfCode(typeCode);
  if (!type) {
    Require(false, "the data type code of an element", typeCode, "from 1 to 10");
    stream().setstate(std::ios_base::failbit);
    return {};
  }
  if (stream().good() && !element_) {
    element_ = {.calibrationX = LoadCalibration(bytes.data()),
                .calibrationY = LoadCalibration(&bytes[kCalibrationBytes])};
  }
  const Size2 size = {LoadLittleEndian<std::int32_t>(&bytes[kSizeX]),
                      LoadLittleEndian<std::int32_t>(&bytes[kSizeY])};
  return PackedLayout(PixelTypeOf(*type), size, position + std::int64_t{kBytes});
}

}  // namespace Qel::Lumetra::ShellExt
