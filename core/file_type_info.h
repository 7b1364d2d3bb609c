// The interface through which the shell objects see an image file, whatever its kind.
//
// A reader is created on an open stream (CreateFileTypeInfo), parses the header in its constructor and is
// read-only afterwards. The caller owns the stream, which must outlive the reader; the reader never closes
// it. Most readers of a file that is not valid leave the stream in a failed state, but only IsValid decides.
// For some contents the constructor throws (emi_parser.h, ser_parser.h).
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>

#include "size2.h"

namespace Qel::Lumetra::ShellExt {

class FileTypeInfo {
 public:
  /// Returns whether the header is acceptable. The other functions return meaningful values for a valid file
  /// only.
  virtual bool IsValid() const = 0;

  /// Returns the description of the file kind from the string table. It is always empty, because the table
  /// has no such descriptions.
  virtual std::wstring GetTypeDescription() const = 0;

  /// Returns the width and height of one frame in pixels.
  virtual Size2 GetDimensions() const = 0;

  /// Returns the number of frames (images or sections).
  virtual std::int32_t GetFrameCount() const = 0;

  /// Returns the bits per pixel.
  virtual std::int32_t GetBitDepth() const = 0;

  /// Returns the display name of the pixel type.
  virtual std::wstring GetDataTypeName() const = 0;

  /// Returns the comment that the file contains; empty if it has none.
  virtual std::wstring GetComment() const = 0;

  /// Returns one frame as a bitmap, reduced to about `size` pixels and owned by the caller; null if the pixel
  /// type cannot be rendered or the pixels cannot be read. Every call seeks in the stream.
  virtual HBITMAP CreateThumbnail(const SIZE& size) const = 0;

  virtual ~FileTypeInfo() = default;

  FileTypeInfo(const FileTypeInfo&) = delete;
  FileTypeInfo& operator=(const FileTypeInfo&) = delete;

 protected:
  FileTypeInfo() = default;
};

}  // namespace Qel::Lumetra::ShellExt
