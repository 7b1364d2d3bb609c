// Opens a reader on a file in memory.
#pragma once

#include <sstream>
#include <string>

#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Owns a file in memory and its reader. The constructor takes a file writer (mrc_file.h and others) and the
/// other arguments of the reader's constructor.
template <class Reader>
class OpenFile {
 public:
  template <class File, class... Arguments>
  explicit OpenFile(const File& file, const Arguments&... arguments)
      : stream_(file.Bytes()), reader_(stream_, arguments...) {}

  const Reader* operator->() const { return &reader_; }

  /// Returns the thumbnail; an empty one if there is none.
  BitmapPixels Thumbnail(const SIZE& size) const { return TakeBitmap(reader_.CreateThumbnail(size)); }

  std::istringstream& stream() { return stream_; }

 private:
  std::istringstream stream_;
  Reader reader_;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
