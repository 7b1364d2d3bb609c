// The reader of every file kind, which implements FileTypeInfo with the kind's parser.
#pragma once

#include <windows.h>

#include <cstdint>
#include <istream>
#include <string>

#include "file_kinds.h"
#include "file_type_info.h"
#include "frame_reader.h"
#include "text.h"

namespace Qel::Lumetra::ShellExt {

template <Parser KindParser>
class ImageFileInfo final : public FileTypeInfo {
 public:
  /// Parses the header. `extension` (without the dot) selects only the description.
  explicit ImageFileInfo(std::istream& stream, const std::wstring& extension = {})
      : parser_(stream), descriptionId_(DescriptionId<KindParser>(extension)) {}

  bool IsValid() const override { return parser_.IsValid(); }
  std::wstring GetTypeDescription() const override { return LoadResourceString(descriptionId_); }
  Size2 GetDimensions() const override { return parser_.frame().size; }
  std::int32_t GetFrameCount() const override { return parser_.frameCount(); }
  std::int32_t GetBitDepth() const override { return parser_.frame().type.bits; }
  std::wstring GetDataTypeName() const override { return parser_.frame().type.name; }
  std::wstring GetComment() const override {
    const auto comment = parser_.comment();
    return WidenComment(comment.data(), comment.data() + comment.size());
  }
  HBITMAP CreateThumbnail(const SIZE& size) const override {
    return ReadThumbnail(parser_.stream(), parser_.frame(), size);
  }

 private:
  KindParser parser_;
  std::uint32_t descriptionId_;
};

using EbnFileInfo = ImageFileInfo<EbnParser>;
using EmiFileInfo = ImageFileInfo<EmiParser>;
using MrcFileInfo = ImageFileInfo<MrcParser>;
using RawFileInfo = ImageFileInfo<RawParser>;
using SerFileInfo = ImageFileInfo<SerParser>;

}  // namespace Qel::Lumetra::ShellExt
