// .ser files: a series of images, found through an array of offsets. The first image stands for the file.
#pragma once

#include <windows.h>

#include <cstdint>
#include <istream>
#include <optional>
#include <string>

#include "data_type.h"
#include "file_type_info.h"
#include "frame_layout.h"
#include "header_check.h"

namespace Qel::Lumetra::ShellExt {

/// The header of a data element, without the calibrations of its axes.
struct SerElement {
  DataType dataType = DataType::kUInt8;
  Size2 size;
  std::int64_t dataPosition = 0;  // file offset of the pixels
};

/// Goes once through the whole index, from the stream's position, and keeps the first element of it. Takes
/// neither memory nor time for more than what the file really holds.
class SerParser {
 public:
  /// Sets failbit on `stream` for a series that is not acceptable. Throws std::length_error for a text of
  /// negative length.
  explicit SerParser(std::istream& stream);

  std::istream& stream() const { return *stream_; }

  /// What is wrong with the header or an element; nothing for a series that is acceptable, be it of images or
  /// of lines. Bytes that the file does not have count as 0.
  const std::optional<HeaderFault>& fault() const { return check_.fault(); }

  bool isImageSeries() const { return isImageSeries_; }  // and not one of lines
  std::int32_t elementCount() const { return elementCount_; }
  const SerElement& firstElement() const { return firstElement_; }

  /// Where the pixels of the first element lie, its first row at the top of the picture.
  FrameLayout FirstFrame() const;

 private:
  void ReadElements(std::uint32_t arrayOffset, std::uint32_t count);

  std::istream* stream_;
  HeaderCheck check_;
  bool isImageSeries_ = false;
  std::int32_t elementCount_ = 0;
  SerElement firstElement_;
};

class SerFileInfo final : public FileTypeInfo {
 public:
  explicit SerFileInfo(std::istream& stream);

  bool IsValid() const override;
  std::wstring GetTypeDescription() const override;
  Size2 GetDimensions() const override;
  std::int32_t GetFrameCount() const override;
  std::int32_t GetBitDepth() const override;
  std::wstring GetDataTypeName() const override;
  std::wstring GetComment() const override;

  /// Shows the first image.
  HBITMAP CreateThumbnail(const SIZE& size) const override;

 private:
  SerParser parser_;
};

}  // namespace Qel::Lumetra::ShellExt
