#include "raw_file_info.h"

#include <algorithm>
#include <array>
#include <optional>

#include "byte_order.h"
#include "frame_reader.h"
#include "text.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::uint32_t kDescriptionId = 215;
constexpr std::int64_t kHeaderBytes = 49;
constexpr std::array kMagic = std::to_array("QEL RawImage");  // with its terminating zero

/// The kind of value is in the upper half of the code, the number of bits in the lower.
std::optional<DataType> TypeOf(std::int32_t code) {
  switch (code) {
    case 0x00008: return DataType::kUInt8;
    case 0x00010: return DataType::kUInt16;
    case 0x00020: return DataType::kUInt32;
    case 0x10008: return DataType::kInt8;
    case 0x10010: return DataType::kInt16;
    case 0x10020: return DataType::kInt32;
    case 0x20020: return DataType::kFloat32;
    case 0x20040: return DataType::kFloat64;
    case 0x30018: return DataType::kRgb24;
    case 0x50018: return DataType::kBgr24;
    case 0xA0040: return DataType::kComplexFloat32;
    case 0xA0080: return DataType::kComplexFloat64;
    default: return std::nullopt;
  }
}

}  // namespace

RawHeader::RawHeader(std::istream& stream) : stream_(&stream) {
  std::array<char, kMagic.size()> magic{};
  stream.read(magic.data(), magic.size());
  const auto word1 = ReadLittleEndian<std::int32_t>(stream);
  size_.width = ReadLittleEndian<std::int32_t>(stream);
  size_.height = ReadLittleEndian<std::int32_t>(stream);
  const auto word4 = ReadLittleEndian<std::int32_t>(stream);
  const auto bitsPerPixel = ReadLittleEndian<std::int32_t>(stream);
  const auto valueClass = ReadLittleEndian<std::int32_t>(stream);
  offset_ = ReadLittleEndian<std::int32_t>(stream);
  pixelStride_ = ReadLittleEndian<std::int32_t>(stream);
  rowStride_ = ReadLittleEndian<std::int32_t>(stream);

  const std::int32_t code = WrapToInt32(std::int64_t{valueClass} * 65536 + bitsPerPixel);
  const auto type = TypeOf(code);
  check_.Require(std::ranges::equal(magic, kMagic), "magic", {}, "the text \"QEL RawImage\" and a zero byte")
      .Require(word1 == 1, "word 1", word1, "1")
      .Require(word4 == word1, "word 4", word4, "1")
      .Require(type.has_value(), "the value class (upper 16 bits) with the bits per pixel (lower 16 bits)",
               code, "one of the format's pairs, such as 0x00010 for 16 bit unsigned");
  if (fault()) {
    stream.setstate(std::ios_base::badbit);
    return;
  }
  dataType_ = *type;
  bytesPerPixel_ = (bitsPerPixel + 7) / 8;
}

FrameLayout RawHeader::Frame() const {
  return {.type = PixelTypeOf(dataType_),
          .size = size_,
          .blockPosition = kHeaderBytes,
          .blockBytes = Extent(),
          .firstPixel = offset_,
          .pixelStride = pixelStride_,
          .rowStride = rowStride_};
}

/// The bytes from the end of the header to the end of the pixel furthest behind it. The sums are 32-bit and
/// wrap, which leaves pixels outside of the extent: such an image cannot be read.
std::int32_t RawHeader::Extent() const {
  const std::int64_t right = WrappingProduct(WrapToInt32(size_.width - std::int64_t{1}), pixelStride_);
  const std::int64_t down = WrappingProduct(WrapToInt32(size_.height - std::int64_t{1}), rowStride_);
  const std::int32_t furthest = std::max({offset_, WrapToInt32(offset_ + right), WrapToInt32(offset_ + down),
                                          WrapToInt32(offset_ + right + down)});
  return WrapToInt32(std::int64_t{furthest} + bytesPerPixel_);
}

RawFileInfo::RawFileInfo(std::istream& stream) : header_(stream) {}

bool RawFileInfo::IsValid() const {
  return header_.stream().good();
}

std::wstring RawFileInfo::GetTypeDescription() const {
  return LoadResourceString(kDescriptionId);
}

Size2 RawFileInfo::GetDimensions() const {
  return header_.size();
}

std::int32_t RawFileInfo::GetFrameCount() const {
  return 1;
}

std::int32_t RawFileInfo::GetBitDepth() const {
  return BitsPerPixel(header_.dataType());
}

std::wstring RawFileInfo::GetDataTypeName() const {
  return DataTypeName(header_.dataType());
}

std::wstring RawFileInfo::GetComment() const {
  return {};
}

HBITMAP RawFileInfo::CreateThumbnail(const SIZE& size) const {
  return ReadThumbnail(header_.stream(), header_.Frame(), size);
}

}  // namespace Qel::Lumetra::ShellExt
