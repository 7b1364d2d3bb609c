#include "raw_parser.h"

#include <algorithm>
#include <array>
#include <optional>

#include "byte_order.h"
#include "data_type.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::int64_t kHeaderBytes = 49;
constexpr std::array kMagic = std::to_array("QEL RawImage");  // with its terminating zero

/// Returns the type for a code with the value class in its upper and the bits per pixel in its lower 16 bits;
/// nothing for an unknown code.
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

RawParser::RawParser(std::istream& stream) : FileParser(stream) {
  std::array<char, kMagic.size()> magic{};
  stream.read(magic.data(), magic.size());
  const auto word1 = ReadLittleEndian<std::int32_t>(stream);
  const auto width = ReadLittleEndian<std::int32_t>(stream);
  const auto height = ReadLittleEndian<std::int32_t>(stream);
  const auto word4 = ReadLittleEndian<std::int32_t>(stream);
  const auto bitsPerPixel = ReadLittleEndian<std::int32_t>(stream);
  const auto valueClass = ReadLittleEndian<std::int32_t>(stream);
  const auto offset = ReadLittleEndian<std::int32_t>(stream);
  const auto pixelStride = ReadLittleEndian<std::int32_t>(stream);
  const auto rowStride = ReadLittleEndian<std::int32_t>(stream);

  const std::int32_t code = WrapToInt32(std::int64_t{valueClass} * 65536 + bitsPerPixel);
  const auto type = TypeOf(code);
  Require(std::ranges::equal(magic, kMagic), "magic", {}, "the text \"QEL RawImage\" and a zero byte");
  Require(word1 == 1, "word 1", word1, "1");
  Require(word4 == word1, "word 4", word4, "1");
  Require(type.has_value(), "the value class (upper 16 bits) with the bits per pixel (lower 16 bits)", code,
          "a combination that the format defines, such as 0x00010 for 16 bit unsigned");
  if (fault()) {
    stream.setstate(std::ios_base::badbit);
    return;
  }
  // The block reaches from the end of the header to the end of the furthest pixel. The sums wrap at 32 bits.
  // A wrap leaves pixels outside the block, and then the image cannot be read. Intentional.
  const std::int64_t right = WrapToInt32((width - std::int64_t{1}) * pixelStride);
  const std::int64_t down = WrapToInt32((height - std::int64_t{1}) * rowStride);
  const std::int32_t furthest = std::max(
      {offset, WrapToInt32(offset + right), WrapToInt32(offset + down), WrapToInt32(offset + right + down)});
  const std::int32_t bytesPerPixel = bitsPerPixel / 8;  // every accepted number of bits is whole bytes
  frame_ = {.type = PixelTypeOf(*type),
            .size = {width, height},
            .blockPosition = kHeaderBytes,
            .blockBytes = WrapToInt32(std::int64_t{furthest} + bytesPerPixel),
            .firstPixel = offset,
            .pixelStride = pixelStride,
            .rowStride = rowStride};
}

}  // namespace Qel::Lumetra::ShellExt
