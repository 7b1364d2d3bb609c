// .raw files: one image behind a header of 49 bytes that begins with "QEL RawImage" and gives the place of
// the first pixel and the steps to the next pixel and the next row, so that packed, padded, interleaved and
// bottom-up images are all alike.
#pragma once

#include <istream>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

class RawParser final : public FileParser {
 public:
  explicit RawParser(std::istream& stream);
};

}  // namespace Qel::Lumetra::ShellExt
