// The MRC family: .mrc, .ali and .rec are one format, a 1024-byte header and a stack of sections, the middle
// one of which stands for the file.
#pragma once

#include <array>
#include <cstdint>
#include <istream>
#include <string>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// Pixel types as this reader numbers them; not the modes of the file, and not DataType.
enum class MrcPixelType : std::uint32_t {
  kUInt8 = 0,
  kInt16 = 1,
  kFloat32 = 2,
  kComplexInt16 = 3,
  kComplexFloat32 = 4,
  kUInt16 = 5,
  kRgb24 = 6,
};

/// Field offsets are those of the MRC2014 format note.
class MrcParser final : public FileParser {
 public:
  explicit MrcParser(std::istream& stream);

  /// The labels in use, trimmed at their end, those that are not empty one per line.
  std::string comment() const;

 private:
  static constexpr std::size_t kBytes = 1024;
  // Offsets in bytes of the words that are used.
  static constexpr std::size_t kNx = 0;
  static constexpr std::size_t kNy = 4;
  static constexpr std::size_t kNz = 8;
  static constexpr std::size_t kMode = 12;
  static constexpr std::size_t kNext = 92;
  static constexpr std::size_t kNlabl = 220;
  static constexpr std::size_t kLabels = 224;

  std::int32_t Word(std::size_t offset) const;
  MrcPixelType PixelTypeOfMode() const;

  /// Where the pixels of a section lie, the first stored row at the bottom of the picture.
  FrameLayout Section(std::int32_t section) const;

  std::array<unsigned char, kBytes> bytes_{};
};

}  // namespace Qel::Lumetra::ShellExt
