#include "emi_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

std::uint32_t Length(std::string_view bytes) {
  return static_cast<std::uint32_t>(bytes.size());
}

std::string Joined(std::string first, std::string_view second) {
  return first.append(second);
}

}  // namespace

std::string EmiOpening(std::uint16_t type, std::uint16_t tag) {
  return FileBytes().Put(type).Put(tag).bytes();
}

std::string EmiEnd() {
  return FileBytes().Put(std::uint16_t{0}).bytes();
}

std::string EmiScalar(std::uint16_t type, std::uint16_t tag, std::string_view value) {
  return Joined(EmiOpening(type, tag), value);
}

std::string EmiDouble(std::uint16_t tag, double value) {
  return EmiScalar(0x0041, tag, BytesOf({value}));
}

std::string EmiText(std::uint16_t tag, std::string_view text, std::optional<std::uint32_t> length) {
  return EmiOpening(0x0060, tag) + FileBytes().Put(length.value_or(Length(text))).Text(text).bytes();
}

std::string EmiArray(std::uint16_t type, std::uint16_t tag, std::string_view payload,
                     std::optional<std::uint32_t> byteCount) {
  return EmiOpening(type, tag) + FileBytes().Put(byteCount.value_or(Length(payload))).Text(payload).bytes();
}

std::string EmiStructure(std::uint16_t type, std::uint16_t tag, std::string_view items) {
  return Joined(EmiOpening(type, tag), items) + EmiEnd();
}

std::string EmiPixelArray(std::uint16_t type, std::uint32_t width, std::uint32_t height,
                          std::string_view pixels) {
  return EmiArray(type, 0x0202, FileBytes().Put(width).Put(height).Text(pixels).bytes());
}

std::string EmiImageObject(std::string_view items) {
  return EmiStructure(0x49B0, 0x0610, items);
}

std::string EmiLineDataObject(std::string_view items) {
  return EmiStructure(0x4700, 0x0610, items);
}

std::string EmiFile::Bytes() const {
  return FileBytes().Put(magic).Put(version).Put(ignored).Text(items).bytes();
}

EmiFile OneImageEmiFile(std::uint16_t arrayType, std::uint32_t width, std::uint32_t height,
                        std::string_view pixels) {
  EmiFile file;
  file.items = EmiImageObject(EmiPixelArray(arrayType, width, height, pixels)) + EmiEnd();
  return file;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
