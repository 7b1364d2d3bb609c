#include "mrc_parser.h"

#include <algorithm>
#include <iterator>
#include <string_view>

#include "byte_order.h"
#include "data_type.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::int32_t kMaxLabels = 10;
constexpr std::size_t kLabelBytes = 80;
constexpr std::uint32_t kMaxMode = 16;

PixelType PixelTypeOf(MrcPixelType type) {
  switch (type) {
    case MrcPixelType::kUInt8: return PixelTypeOf(DataType::kUInt8);
    case MrcPixelType::kInt16: return PixelTypeOf(DataType::kInt16);
    case MrcPixelType::kFloat32: return PixelTypeOf(DataType::kFloat32);
    case MrcPixelType::kComplexInt16:
      return PixelType::Of<ComplexPixel<std::int16_t>>(L"32 bit complex integer");
    case MrcPixelType::kComplexFloat32: return PixelTypeOf(DataType::kComplexFloat32);
    case MrcPixelType::kUInt16: return PixelTypeOf(DataType::kUInt16);
    case MrcPixelType::kRgb24: return PixelTypeOf(DataType::kRgb24);
  }
  return {};
}

/// Reverses the bytes of `count` words of `wordBytes` bytes each.
void SwapWords(unsigned char* bytes, std::size_t wordBytes, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) std::reverse(bytes + i * wordBytes, bytes + (i + 1) * wordBytes);
}

/// Swaps the header words that are integers in every variant of the format. The floats remain unswapped,
/// because none of them is used.
void SwapHeader(unsigned char* bytes) {
  struct Words {
    std::size_t offset, wordBytes, count;
  };
  static constexpr Words kIntegers[] = {
      {0, 4, 10},               // size, mode, start and intervals
      {64, 4, 3},  {92, 4, 1},  // axis order, extended header
      {220, 4, 1},              // number of labels
      {88, 2, 2},  {96, 2, 1},  // 16-bit words of older variants
      {128, 2, 4}, {160, 2, 4}, {168, 2, 2},
  };
  for (const Words& words : kIntegers) SwapWords(bytes + words.offset, words.wordBytes, words.count);
}

}  // namespace

MrcParser::MrcParser(std::istream& stream) : FileParser(stream) {
  stream.read(reinterpret_cast<char*>(bytes_.data()), kHeaderBytes);
  // No frame is this large in both directions, so such a header is big-endian.
  constexpr std::uint32_t kTooLarge = 65536;
  isSwapped_ = static_cast<std::uint32_t>(Word(kNx)) >= kTooLarge &&
               static_cast<std::uint32_t>(Word(kNy)) >= kTooLarge;
  if (isSwapped_) SwapHeader(bytes_.data());
  Require(Word(kNx) >= 1, "nx", Word(kNx), "at least 1");
  Require(Word(kNy) >= 1, "ny", Word(kNy), "at least 1");
  Require(Word(kNz) >= 1, "nz", Word(kNz), "at least 1");
  Require(static_cast<std::uint32_t>(Word(kMode)) <= kMaxMode, "mode", Word(kMode), "from 0 to 16");
  if (fault()) {
    stream.setstate(std::ios_base::badbit);
    return;
  }
  frameCount_ = Word(kNz);
  frame_ = Section(frameCount_ / 2);
}

std::int32_t MrcParser::Word(std::size_t offset) const {
  return LoadLittleEndian<std::int32_t>(&bytes_[offset]);
}

MrcPixelType MrcParser::PixelTypeOfMode() const {
  switch (Word(kMode)) {
    case 1: return MrcPixelType::kInt16;
    case 2: return MrcPixelType::kFloat32;
    case 3: return MrcPixelType::kComplexInt16;
    case 4: return MrcPixelType::kComplexFloat32;
    case 6: return MrcPixelType::kUInt16;
    case 16: return MrcPixelType::kRgb24;
    default: return MrcPixelType::kUInt8;  // mode 0 and every unknown mode
  }
}

std::string MrcParser::comment() const {
  std::string text;
  const std::int32_t count = std::min(Word(kNlabl), kMaxLabels);
  for (std::int32_t i = 0; i < count; ++i) {
    const unsigned char* const first = &bytes_[kLabels + static_cast<std::size_t>(i) * kLabelBytes];
    std::string_view label(reinterpret_cast<const char*>(first), kLabelBytes);
    label = label.substr(0, label.find('\0'));
    label = label.substr(0, label.find_last_not_of(' ') + 1);
    if (label.empty()) continue;
    if (!text.empty()) text += "\r\n";
    text += label;
  }
  return text;
}

FrameLayout MrcParser::Section(std::int32_t section) const {
  const PixelType type = PixelTypeOf(PixelTypeOfMode());
  const Size2 size = {Word(kNx), Word(kNy)};
  // Sizes and positions wrap at 32 bits, so a section that begins between 2 and 4 GiB cannot be read, and one
  // beyond 4 GiB may show another part of the file. Intentional.
  const std::int32_t frameBytes = WrappingProduct(WrappingProduct(size.width, size.height), type.bytes());
  const std::int32_t position =
      WrapToInt32(std::int64_t{kHeaderBytes} + Word(kNext) + WrappingProduct(frameBytes, section));
  FrameLayout layout = FlippedVertically(PackedLayout(type, size, position));
  layout.blockBytes = frameBytes;
  // Only 16-bit pixels are swapped. Floats, complex numbers and colours of a swapped file are not.
  // Intentional.
  layout.swapBytes = isSwapped_ && type.bits == 16;
  return layout;
}

}  // namespace Qel::Lumetra::ShellExt
