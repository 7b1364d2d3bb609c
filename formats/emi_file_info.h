// .emi files: a tree of tagged items, some of which are image objects. The first image stands for the file.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <istream>
#include <optional>
#include <string>
#include <vector>

#include "data_type.h"
#include "file_type_info.h"
#include "frame_layout.h"
#include "header_check.h"

namespace Qel::Lumetra::ShellExt {

/// What every item begins with. Its type says how its value is stored, type and tag together what it means.
struct EmiItemId {
  std::uint16_t type = 0;
  std::uint16_t tag = 0;

  friend bool operator==(const EmiItemId&, const EmiItemId&) = default;
};

/// An image object; all 0 until a pixel array of a known type is found in it.
struct EmiImage {
  DataType dataType = DataType::kUInt8;
  Size2 size;
  std::int64_t dataPosition = 0;  // file offset of the pixels
};

/// Walks once through the whole tree, from the stream's position, counts its images and keeps the first.
/// The tree may be of any depth: the open items are kept on the heap, four bytes each as in the file.
class EmiParser {
 public:
  /// A file with another header is not walked. A walk ends at the end of the tree or of the file, and leaves
  /// the stream good. Throws std::invalid_argument ("bad EMI object index") for an item that is not as deep
  /// in the tree as its meaning asks for.
  explicit EmiParser(std::istream& stream);

  std::istream& stream() const { return *stream_; }

  /// What is wrong with the header; nothing for one that is acceptable. Bytes that the file does not have
  /// count as 0.
  const std::optional<HeaderFault>& fault() const { return check_.fault(); }
  std::int32_t imageCount() const;
  const EmiImage& firstImage() const { return firstImage_; }

  /// Where the pixels of the first image lie, its first row at the top of the picture.
  FrameLayout FirstFrame() const;

 private:
  EmiItemId ReadItemId();
  void Walk();

  /// Goes past the value of the innermost open item. False for a structure, whose value is a list of items.
  bool ReadValue();
  void ReadArray();
  void ReadPixelArray();

  /// An open item: -1 is the innermost one, -2 its parent.
  const EmiItemId& PathEntry(std::ptrdiff_t index) const;

  std::istream* stream_;
  HeaderCheck check_;
  std::vector<EmiItemId> objectPath_;  // the open items, innermost last
  std::uint64_t imageCount_ = 0;
  EmiImage firstImage_;
};

class EmiFileInfo final : public FileTypeInfo {
 public:
  explicit EmiFileInfo(std::istream& stream);

  /// Whether there is an image. The stream may be at its end or have failed in a read.
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
  EmiParser parser_;
};

}  // namespace Qel::Lumetra::ShellExt
