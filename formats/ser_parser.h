// .ser files: a series of images, found through an array of offsets. The first image stands for the file.
#pragma once

#include <cstdint>
#include <istream>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// Goes once through the whole index, from the stream's position, and keeps the first element of it. Takes
/// neither memory nor time for more than what the file really holds.
class SerParser final : public FileParser {
 public:
  /// Throws std::length_error for a text of negative length.
  explicit SerParser(std::istream& stream);

  /// A series of lines is parsed too, but is not valid.
  bool IsValid() const { return stream().good() && isImageSeries_; }

 private:
  void ReadElements(std::uint32_t arrayOffset, std::uint32_t count);

  /// Fails the stream for an element that is not there or of an unknown type.
  FrameLayout ReadElement(std::uint32_t position);

  bool isImageSeries_ = false;
};

}  // namespace Qel::Lumetra::ShellExt
