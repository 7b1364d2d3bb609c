// The MRC family: .mrc, .ali and .rec are one format, a 1024-byte header and a stack of sections. The middle
// section represents the file.
#pragma once

#include <array>
#include <cstdint>
#include <istream>
#include <string>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// The parser's own numbers of pixel types, which are neither the modes of the file nor those of DataType.
enum class MrcPixelType : std::uint32_t {
  kUInt8 = 0,
  kInt16 = 1,
  kFloat32 = 2,
  kComplexInt16 = 3,
  kComplexFloat32 = 4,
  kUInt16 = 5,
  kRgb24 = 6,
};

/// The offsets of fields are from the MRC2014 format note.
class MrcParser final : public FileParser {
 public:
  explicit MrcParser(std::istream& stream);

  /// Returns the labels in use, without trailing spaces and without empty ones, one per line.
  std::string comment() const;

 private:
  static constexpr std::size_t kHeaderBytes = 1024;
  // Offsets in bytes of the fields that are used.
  static constexpr std::size_t kNx = 0;
  static constexpr std::size_t kNy = 4;
  static constexpr std::size_t kNz = 8;
  static constexpr std::size_t kMode = 12;
  static constexpr std::size_t kNext = 92;
  static constexpr std::size_t kNlabl = 220;
  static constexpr std::size_t kLabels = 224;

  std::int32_t Word(std::size_t offset) const;
  MrcPixelType PixelTypeOfMode() const;

  /// Returns the layout of a section. The first stored row is at the bottom of the frame.
  FrameLayout Section(std::int32_t section) const;

  std::array<unsigned char, kHeaderBytes> bytes_{};
};

}  // namespace Qel::Lumetra::ShellExt
