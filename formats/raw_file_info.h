// .raw files: one image behind a header of 49 bytes that begins with "QEL RawImage" and gives the place of
// the first pixel and the steps to the next pixel and the next row, so that packed, padded, interleaved and
// bottom-up images are all alike.
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

/// The header, read once from the stream's position.
class RawHeader {
 public:
  /// Sets badbit on `stream` for a header that is not acceptable.
  explicit RawHeader(std::istream& stream);

  std::istream& stream() const { return *stream_; }

  /// What is wrong with the header; nothing for one that is acceptable. Bytes that the file does not have
  /// count as 0.
  const std::optional<HeaderFault>& fault() const { return check_.fault(); }

  DataType dataType() const { return dataType_; }
  Size2 size() const { return size_; }

  /// Where the pixels lie, the first row at the top of the picture.
  FrameLayout Frame() const;

 private:
  std::int32_t Extent() const;

  std::istream* stream_;
  HeaderCheck check_;
  DataType dataType_ = DataType::kUInt8;
  Size2 size_;
  std::int32_t bytesPerPixel_ = 0;
  std::int32_t offset_ = 0;       // of the first pixel, from the end of the header
  std::int32_t pixelStride_ = 0;  // in bytes, like rowStride_; both may be negative
  std::int32_t rowStride_ = 0;
};

class RawFileInfo final : public FileTypeInfo {
 public:
  explicit RawFileInfo(std::istream& stream);

  bool IsValid() const override;
  std::wstring GetTypeDescription() const override;
  Size2 GetDimensions() const override;
  std::int32_t GetFrameCount() const override;
  std::int32_t GetBitDepth() const override;
  std::wstring GetDataTypeName() const override;
  std::wstring GetComment() const override;
  HBITMAP CreateThumbnail(const SIZE& size) const override;

 private:
  RawHeader header_;
};

}  // namespace Qel::Lumetra::ShellExt
