// The one interface through which the shell objects see an image file, whatever its kind.
//
// A reader is made on an open stream (CreateFileTypeInfo), parses the header in its constructor and is
// read-only afterwards. The stream is the caller's: the reader never closes it, and it must outlive the
// reader. A file that is not acceptable leaves the stream failed; nothing is thrown for bad contents.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>

#include "size2.h"

namespace Qel::Lumetra::ShellExt {

class FileTypeInfo {
 public:
  /// Ask this first: every other answer is meaningful for a valid file only.
  virtual bool IsValid() const = 0;

  /// A text of the string table; empty while the table has no descriptions of file kinds.
  virtual std::wstring GetTypeDescription() const = 0;

  /// Width and height of one frame in pixels.
  virtual Size2 GetDimensions() const = 0;

  /// Number of frames (images, sections).
  virtual std::int32_t GetFrameCount() const = 0;

  /// Bits of one pixel.
  virtual std::int32_t GetBitDepth() const = 0;

  /// Display name of the pixel type.
  virtual std::wstring GetDataTypeName() const = 0;

  /// Free text that the file carries; empty where it has none.
  virtual std::wstring GetComment() const = 0;

  /// One frame as a bitmap reduced towards `size` pixels, owned by the caller; null when the pixel type
  /// has no picture or the pixels cannot be read. Every call seeks the stream itself.
  virtual HBITMAP CreateThumbnail(const SIZE& size) const = 0;

  virtual ~FileTypeInfo() = default;

  FileTypeInfo(const FileTypeInfo&) = delete;
  FileTypeInfo& operator=(const FileTypeInfo&) = delete;

 protected:
  FileTypeInfo() = default;
};

}  // namespace Qel::Lumetra::ShellExt
