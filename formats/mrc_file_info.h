// The MRC family: .mrc, .ali and .rec are one format, a 1024-byte header and a stack of sections.
#pragma once

#include <windows.h>

#include <array>
#include <cstdint>
#include <istream>
#include <optional>
#include <string>

#include "file_type_info.h"
#include "frame_layout.h"
#include "header_check.h"

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

/// The fixed header, read once from the stream's position. Field offsets are those of the MRC2014 format
/// note.
class MrcHeader {
 public:
  /// Sets badbit on `stream` for a header that is not acceptable.
  explicit MrcHeader(std::istream& stream);

  std::istream& stream() const { return *stream_; }

  /// What is wrong with the header; nothing for one that is acceptable. Bytes that the file does not have
  /// count as 0.
  const std::optional<HeaderFault>& fault() const { return check_.fault(); }

  /// Whether it is read as one that a big-endian machine wrote.
  bool isSwapped() const { return swapped_; }

  Size2 size() const { return {Word(kNx), Word(kNy)}; }
  std::int32_t sections() const { return Word(kNz); }
  MrcPixelType pixelType() const;

  /// The labels in use, trimmed at their end, those that are not empty one per line.
  std::string Labels() const;

  /// Where the pixels of a section lie, the first stored row at the bottom of the picture.
  FrameLayout Section(std::int32_t section) const;

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
  HeaderCheck Check() const;

  std::istream* stream_;
  std::array<unsigned char, kBytes> bytes_{};
  HeaderCheck check_;
  bool swapped_ = false;  // written on a big-endian machine
};

class MrcFileInfo final : public FileTypeInfo {
 public:
  /// `extension` (without the dot) only chooses the description: "ali", "rec" or anything else.
  MrcFileInfo(std::istream& stream, const std::wstring& extension);

  bool IsValid() const override;
  std::wstring GetTypeDescription() const override;
  Size2 GetDimensions() const override;
  std::int32_t GetFrameCount() const override;
  std::int32_t GetBitDepth() const override;
  std::wstring GetDataTypeName() const override;
  std::wstring GetComment() const override;

  /// Shows the middle section.
  HBITMAP CreateThumbnail(const SIZE& size) const override;

 private:
  MrcHeader header_;
  std::uint32_t descriptionId_;
};

}  // namespace Qel::Lumetra::ShellExt
