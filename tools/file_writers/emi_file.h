// Writes .emi files. Every function returns the bytes of an item; concatenated items are a list.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "file_bytes.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns the bytes of an item's type and tag. In a structure the items follow them directly.
std::string EmiOpening(std::uint16_t type, std::uint16_t tag);

/// Returns the end marker of a list.
std::string EmiEnd();

/// Returns an item of a fixed size: one of the types 0x0010 to 0x0041. `value` is its bytes.
std::string EmiScalar(std::uint16_t type, std::uint16_t tag, std::string_view value);

std::string EmiDouble(std::uint16_t tag, double value);

/// Returns a string item. If `length` is given, the item states it instead of the true length.
std::string EmiText(std::uint16_t tag, std::string_view text, std::optional<std::uint32_t> length = {});

/// Returns an array. If `byteCount` is given, the item states it instead of its true size in bytes.
std::string EmiArray(std::uint16_t type, std::uint16_t tag, std::string_view payload,
                     std::optional<std::uint32_t> byteCount = {});

/// Returns a structure of the items in `items`, with its end marker.
std::string EmiStructure(std::uint16_t type, std::uint16_t tag, std::string_view items);

/// Returns a pixel array of an image object. The even types from 0x2200 to 0x2214 are signed and unsigned
/// integers of 8, 16 and 32 bits, float, double, (0x2210: unused), complex of doubles and complex of floats.
std::string EmiPixelArray(std::uint16_t type, std::uint32_t width, std::uint32_t height,
                          std::string_view pixels);

std::string EmiImageObject(std::string_view items);
std::string EmiLineDataObject(std::string_view items);

struct EmiFile {
  std::uint16_t magic = 0x4B4A;
  std::uint16_t version = 0x0200;
  std::uint32_t ignored = 0;
  std::string items{};  // the top-level list, with or without its end marker

  std::string Bytes() const;
};

/// Returns a file with one image object.
EmiFile OneImageEmiFile(std::uint16_t arrayType, std::uint32_t width, std::uint32_t height,
                        std::string_view pixels);

}  // namespace Qel::Lumetra::ShellExt::Testing
