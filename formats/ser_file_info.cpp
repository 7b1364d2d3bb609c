#include "ser_file_info.h"

#include <algorithm>
#include <array>
#include <stdexcept>

#include "byte_order.h"
#include "frame_reader.h"
#include "skip_bytes.h"
#include "text.h"
#include "type_code.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::uint32_t kDescriptionId = 213;

constexpr std::uint16_t kByteOrder = 0x4949;
constexpr std::uint16_t kSeriesId = 0x0197;
constexpr std::uint16_t kFirstVersion = 0x0210;
constexpr std::uint16_t kFirstWideVersion = 0x0220;  // gives the place of the offset arrays in 64 bits
constexpr std::uint32_t kLines = 0x4120;
constexpr std::uint32_t kImages = 0x4122;
constexpr std::uint32_t kTimeTags = 0x4152;
constexpr std::uint32_t kPositionTags = 0x4142;

constexpr std::uint32_t kCalibrationBytes = 20;

struct SerHeader {
  std::uint16_t byteOrder = 0;
  std::uint16_t seriesId = 0;
  std::uint16_t seriesVersion = 0;
  std::uint32_t dataTypeId = 0;
  std::uint32_t tagTypeId = 0;
  std::uint32_t totalElements = 0;
  std::uint32_t validElements = 0;
  std::uint32_t offsetArrayOffset = 0;
  std::uint32_t dimensionCount = 0;

  HeaderCheck Check() const {
    return HeaderCheck()
        .Require(byteOrder == kByteOrder, "byte order", byteOrder, "0x4949")
        .Require(seriesId == kSeriesId, "series id", seriesId, "0x0197")
        .Require(seriesVersion >= kFirstVersion, "series version", seriesVersion, "0x0210 or above")
        .Require(validElements >= 1, "valid elements", validElements, "at least 1")
        .Require(totalElements >= validElements, "total elements", totalElements,
                 "at least the number of valid elements")
        .Require(dataTypeId == kLines || dataTypeId == kImages, "data type id", dataTypeId,
                 "0x4122 (images) or 0x4120 (lines)")
        .Require(tagTypeId == kTimeTags || tagTypeId == kPositionTags, "tag type id", tagTypeId,
                 "0x4152 (times) or 0x4142 (positions)");
  }
};

SerHeader ReadHeader(std::istream& stream) {
  SerHeader header;
  header.byteOrder = ReadLittleEndian<std::uint16_t>(stream);
  header.seriesId = ReadLittleEndian<std::uint16_t>(stream);
  header.seriesVersion = ReadLittleEndian<std::uint16_t>(stream);
  header.dataTypeId = ReadLittleEndian<std::uint32_t>(stream);
  header.tagTypeId = ReadLittleEndian<std::uint32_t>(stream);
  header.totalElements = ReadLittleEndian<std::uint32_t>(stream);
  header.validElements = ReadLittleEndian<std::uint32_t>(stream);
  // Of a wide offset only the low half counts, on purpose: all other offsets have 32 bits in any version.
  header.offsetArrayOffset = header.seriesVersion >= kFirstWideVersion
                                 ? static_cast<std::uint32_t>(ReadLittleEndian<std::uint64_t>(stream))
                                 : ReadLittleEndian<std::uint32_t>(stream);
  header.dimensionCount = ReadLittleEndian<std::uint32_t>(stream);
  return header;
}

void SkipText(std::istream& stream) {
  const auto length = ReadLittleEndian<std::int32_t>(stream);
  if (!stream.good()) return;
  if (length < 0) throw std::length_error("negative SER text length");
  SkipBytes(stream, static_cast<std::uint32_t>(length));
}

/// Nothing of the dimensions is shown, but a series that ends within them is not a valid one.
void SkipDimensions(std::istream& stream, std::uint32_t count) {
  for (std::uint32_t i = 0; i < count && stream.good(); ++i) {
    SkipBytes(stream, sizeof(std::uint32_t) + kCalibrationBytes);  // its size and calibration
    SkipText(stream);                                              // its description
    SkipText(stream);                                              // and its units
  }
}

/// Fails the stream for an element that is not there or of an unknown type.
SerElement ReadElement(std::istream& stream, std::uint32_t position, HeaderCheck& check) {
  constexpr std::size_t kTypeCode =
      std::size_t{2} * kCalibrationBytes;  // the calibrations of both axes come first
  constexpr std::size_t kSizeX = kTypeCode + sizeof(std::int16_t);
  constexpr std::size_t kSizeY = kSizeX + sizeof(std::uint32_t);
  constexpr std::size_t kBytes = kSizeY + sizeof(std::uint32_t);

  std::array<unsigned char, kBytes> bytes{};
  stream.seekg(position);
  stream.read(reinterpret_cast<char*>(bytes.data()), kBytes);
  const auto typeCode = LoadLittleEndian<std::int16_t>(&bytes[kTypeCode]);
  const auto type = DataTypeOfCode(typeCode);
  if (!type) {
    check.Require(false, "the data type code of an element", typeCode, "from 1 to 10");
    stream.setstate(std::ios_base::failbit);
    return {};
  }
  return {*type,
          {LoadLittleEndian<std::int32_t>(&bytes[kSizeX]), LoadLittleEndian<std::int32_t>(&bytes[kSizeY])},
          position + std::int64_t{kBytes}};
}

}  // namespace

SerParser::SerParser(std::istream& stream) : stream_(&stream) {
  const SerHeader header = ReadHeader(stream);
  check_ = header.Check();
  if (fault()) {
    stream.setstate(std::ios_base::failbit);
    return;
  }
  isImageSeries_ = header.dataTypeId == kImages;
  SkipDimensions(stream, header.dimensionCount);
  ReadElements(header.offsetArrayOffset, header.validElements);
}

void SerParser::ReadElements(std::uint32_t arrayOffset, std::uint32_t count) {
  constexpr std::size_t kEntryBytes = sizeof(std::uint32_t);
  constexpr std::uint32_t kMostEntries = 1024;  // that are held at a time

  // The offsets of the elements are followed by as many of their tags, on purpose even where the header
  // has room for more elements than are valid. Nothing is done with the tags, but their offsets must be
  // there, and they are if their last byte is.
  stream_->seekg(std::int64_t{arrayOffset} + 2 * std::int64_t{kEntryBytes} * count - 1);
  stream_->get();

  elementCount_ = WrapToInt32(std::uint64_t{count});
  std::array<unsigned char, kMostEntries * kEntryBytes> offsets;
  for (std::uint32_t done = 0; done < count && stream_->good();) {
    const std::uint32_t entries = std::min(kMostEntries, count - done);
    stream_->seekg(arrayOffset + std::int64_t{kEntryBytes} * done);
    stream_->read(reinterpret_cast<char*>(offsets.data()), std::streamsize{kEntryBytes} * entries);
    for (std::uint32_t i = 0; i < entries && stream_->good(); ++i) {
      const auto offset = LoadLittleEndian<std::uint32_t>(&offsets[i * kEntryBytes]);
      const SerElement element = ReadElement(*stream_, offset, check_);
      if (done + i == 0) firstElement_ = element;
    }
    done += entries;
  }
}

FrameLayout SerParser::FirstFrame() const {
  return PackedLayout(PixelTypeOf(firstElement_.dataType), firstElement_.size, firstElement_.dataPosition);
}

SerFileInfo::SerFileInfo(std::istream& stream) : parser_(stream) {}

bool SerFileInfo::IsValid() const {
  return parser_.stream().good() && parser_.isImageSeries();
}

std::wstring SerFileInfo::GetTypeDescription() const {
  return LoadResourceString(kDescriptionId);
}

Size2 SerFileInfo::GetDimensions() const {
  return parser_.firstElement().size;
}

std::int32_t SerFileInfo::GetFrameCount() const {
  return parser_.elementCount();
}

std::int32_t SerFileInfo::GetBitDepth() const {
  return BitsPerPixel(parser_.firstElement().dataType);
}

std::wstring SerFileInfo::GetDataTypeName() const {
  return DataTypeName(parser_.firstElement().dataType);
}

std::wstring SerFileInfo::GetComment() const {
  return {};
}

HBITMAP SerFileInfo::CreateThumbnail(const SIZE& size) const {
  return ReadThumbnail(parser_.stream(), parser_.FirstFrame(), size);
}

}  // namespace Qel::Lumetra::ShellExt
