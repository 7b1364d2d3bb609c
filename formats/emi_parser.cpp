#include "emi_parser.h"

#include <optional>
#include <utility>

#include "byte_order.h"
#include "data_type.h"
#include "read_text.h"
#include "skip_bytes.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::uint16_t kMagic = 0x4B4A;
constexpr std::int16_t kMaxVersion = 0x0200;

constexpr EmiItemId kImageObject = {0x49B0, 0x0610};
constexpr EmiItemId kLineDataObject = {0x4700, 0x0610};
constexpr std::uint16_t kDataTag = 0x0202;  // the array with the pixels or values of an object

/// The position of an object's extra values: directly in `structure`, which is directly in the object.
struct ExtraValues {
  EmiItemId object;
  EmiItemId structure;
  std::uint16_t tag1;
  std::uint16_t tag2;
};

constexpr ExtraValues kExtraValues[] = {{kImageObject, {0x4102, 0x0300}, 0x0120, 0x0130},
                                        {kLineDataObject, {0x4100, 0x0300}, 0x0100, 0x0120}};

constexpr std::uint16_t kDouble = 0x0041;
constexpr std::uint16_t kText = 0x0060;
constexpr std::uint16_t kArrayBit = 0x2000;

/// Returns the bytes of an item's value if the item is a single number that the parser ignores; nothing for
/// another item.
std::optional<std::uint32_t> BytesOfNumber(std::uint16_t type) {
  switch (type) {
    case 0x0010:
    case 0x0020:
    case 0x0070: return 1;
    case 0x0030:
    case 0x0032: return 2;
    case 0x0031:
    case 0x0033:
    case 0x0040: return 4;
    case 0x0034: return 8;
    default: return std::nullopt;
  }
}

/// Returns whether `type` is a data array: an even number from 0x2100 to 0x2114 (lines) or from 0x2200 to
/// 0x2214 (images).
bool IsDataArray(std::uint16_t type) {
  const int group = type & 0xFF00;
  const int elementType = type & 0x00FF;
  return (group == 0x2100 || group == 0x2200) && elementType <= 0x14 && elementType % 2 == 0;
}

/// Returns whether an item is the array with the values of a line (`group` 0x2100) or the pixels of an image
/// (0x2200).
bool IsArrayOf(EmiItemId id, int group) {
  return IsDataArray(id.type) && (id.type & 0xFF00) == group && id.tag == kDataTag;
}

/// Returns the string of an object for the tag `tag`; null for a tag that is not kept.
std::string* LabelOf(EmiDataObject& object, std::uint16_t tag) {
  switch (tag) {
    case 0x0100: return &object.label100;
    case 0x0419: return &object.label419;
    case 0x0400: return &object.label400;
    case 0x0440: return &object.label440;
    default: return nullptr;
  }
}

/// Returns the type of a data array's elements; nothing for an unknown type. The larger of the two complex
/// types has the smaller number.
std::optional<DataType> ElementType(std::uint16_t arrayType) {
  switch (arrayType & 0x00FF) {
    case 0x00: return DataType::kInt8;
    case 0x02: return DataType::kUInt8;
    case 0x04: return DataType::kInt16;
    case 0x06: return DataType::kUInt16;
    case 0x08: return DataType::kInt32;
    case 0x0A: return DataType::kUInt32;
    case 0x0C: return DataType::kFloat32;
    case 0x0E: return DataType::kFloat64;
    case 0x12: return DataType::kComplexFloat64;
    case 0x14: return DataType::kComplexFloat32;
    default: return std::nullopt;
  }
}

}  // namespace

EmiParser::EmiParser(std::istream& stream) : FileParser(stream) {
  // The default for a first image in which no pixel array of a known type is found.
  frame_ = PackedLayout(PixelTypeOf(DataType::kUInt8), {}, 0);
  const auto magic = ReadLittleEndian<std::uint16_t>(stream);
  const auto version = ReadLittleEndian<std::int16_t>(stream);
  ReadLittleEndian<std::uint32_t>(stream);  // unknown purpose
  Require(magic == kMagic, "magic", magic, "0x4B4A");
  Require(version <= kMaxVersion, "version", version, "0x0200 or below");
  if (stream.good() && !fault()) {
    Traverse();
    // A traversal that ends at the end of the file is a success, because what it found is usable.
    stream.clear();
  }
  frameCount_ = WrapToInt32(imageCount_);
  Require(imageCount_ > 0, "The file contains no image object.");
}

void EmiParser::Traverse() {
  while (true) {
    const EmiItemId id = ReadItemId();
    if (!stream().good()) return;
    if (id.type == 0) {  // the end of a list
      if (objectPath_.empty()) return;
      objectPath_.CloseInnermost();
      continue;
    }
    objectPath_.Open(id);
    if (id == kImageObject) ++imageCount_;
    if (id == kLineDataObject) ++lineDataCount_;
    if (ReadValue()) objectPath_.CloseInnermost();
  }
}

EmiItemId EmiParser::ReadItemId() {
  EmiItemId id;
  id.type = ReadLittleEndian<std::uint16_t>(stream());
  if (id.type != 0) id.tag = ReadLittleEndian<std::uint16_t>(stream());
  return id;
}

bool EmiParser::ReadValue() {
  const std::uint16_t type = objectPath_.At(-1).type;
  if (type == kDouble) {
    ReadDoubleValue();
    return true;
  }
  if (const auto bytes = BytesOfNumber(type)) {
    SkipBytes(stream(), *bytes);
    return true;
  }
  if (type == kText) {
    ReadTextValue();
    return true;
  }
  if ((type & kArrayBit) != 0) {
    ReadArray();
    return true;
  }
  return false;
}

void EmiParser::ReadDoubleValue() {
  const EmiItemId object = objectPath_.At(-3);  // throws unless the double is in a structure of an object
  const auto number = ReadLittleEndian<double>(stream());
  if (!stream().good()) return;
  for (const ExtraValues& values : kExtraValues) {
    if (object != values.object || objectPath_.At(-2) != values.structure) continue;
    EmiDataObject* const kept = KeptObject(object);
    if (kept == nullptr) return;
    const std::uint16_t tag = objectPath_.At(-1).tag;
    if (tag == values.tag1) kept->extraValue1 = number;
    if (tag == values.tag2) kept->extraValue2 = number;
  }
}

void EmiParser::ReadTextValue() {
  EmiDataObject* const kept = KeptObject(objectPath_.At(-2));  // throws unless the string is in an object
  std::string* const label = kept == nullptr ? nullptr : LabelOf(*kept, objectPath_.At(-1).tag);
  const auto length = ReadLittleEndian<std::uint32_t>(stream());
  if (label == nullptr) {
    SkipBytes(stream(), length);
    return;
  }
  std::string text = ReadText(stream(), length);
  if (stream().good()) *label = std::move(text);
}

void EmiParser::ReadArray() {
  const auto byteCount = ReadLittleEndian<std::uint32_t>(stream());
  const EmiItemId id = objectPath_.At(-1);
  if (IsDataArray(id.type)) {
    const EmiItemId& parent = objectPath_.At(-2);
    if (parent == kImageObject && IsArrayOf(id, 0x2200)) ReadPixelArray();
    if (parent == kLineDataObject && IsArrayOf(id, 0x2100)) ReadLineArray();
  }
  // The byte count alone determines the position of the next item, even if it contradicts the array's width
  // and height.
  SkipBytes(stream(), byteCount);
}

void EmiParser::ReadPixelArray() {
  const std::int64_t start = stream().tellg();
  const auto width = ReadLittleEndian<std::int32_t>(stream());
  const auto height = ReadLittleEndian<std::int32_t>(stream());
  // The array belongs to the most recently opened image.
  if (const auto type = ElementType(objectPath_.At(-1).type); type && imageCount_ == 1) {
    frame_ = PackedLayout(PixelTypeOf(*type), {width, height}, stream().tellg());
  }
  stream().seekg(start);
}

void EmiParser::ReadLineArray() {
  const auto type = ElementType(objectPath_.At(-1).type);
  if (!type || lineDataCount_ != 1) return;
  const std::int64_t start = stream().tellg();
  const auto length = ReadLittleEndian<std::uint32_t>(stream());
  if (stream().good()) {
    lineData_.length = length;
    lineData_.dataType = type;
  }
  stream().seekg(start);
}

EmiDataObject* EmiParser::KeptObject(const EmiItemId& id) {
  if (id == kImageObject && imageCount_ == 1) return &image_;
  if (id == kLineDataObject && lineDataCount_ == 1) return &lineData_;
  return nullptr;
}

}  // namespace Qel::Lumetra::ShellExt
