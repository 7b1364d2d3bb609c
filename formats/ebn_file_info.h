// .ebn files: one image behind a header that also describes the microscope in five numbers.
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
class EbnParser {
 public:
  /// Sets failbit on `stream` for a header that is not acceptable.
  explicit EbnParser(std::istream& stream);

  std::istream& stream() const { return *stream_; }

  /// What is wrong with the header; nothing for one that is acceptable. Bytes that the file does not have
  /// count as 0.
  const std::optional<HeaderFault>& fault() const { return check_.fault(); }

  DataType dataType() const { return dataType_; }
  Size2 size() const { return size_; }

  /// The microscope in one line, for instance "Halden 20 FEG 200.0 kV".
  const std::string& comment() const { return comment_; }

  /// Where the pixels lie, the first row at the top of the picture.
  FrameLayout Frame() const;

 private:
  std::istream* stream_;
  HeaderCheck check_;
  DataType dataType_ = DataType::kUInt8;
  Size2 size_;
  std::int32_t dataOffset_ = 0;  // file offset of the pixels
  std::string comment_;
};

class EbnFileInfo final : public FileTypeInfo {
 public:
  explicit EbnFileInfo(std::istream& stream);

  bool IsValid() const override;
  std::wstring GetTypeDescription() const override;
  Size2 GetDimensions() const override;
  std::int32_t GetFrameCount() const override;
  std::int32_t GetBitDepth() const override;
  std::wstring GetDataTypeName() const override;
  std::wstring GetComment() const override;
  HBITMAP CreateThumbnail(const SIZE& size) const override;

 private:
  EbnParser parser_;
};

}  // namespace Qel::Lumetra::ShellExt
