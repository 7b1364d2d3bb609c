// .raw files: one image after a header of 49 bytes. The header begins with "QEL RawImage" and contains the
// position of the first pixel and the strides to the next pixel and to the next row. Packed, padded,
// interleaved and bottom-up images therefore need no separate code.
#pragma once

#include <istream>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

class RawParser final : public FileParser {
 public:
  explicit RawParser(std::istream& stream);
};

}  // namespace Qel::Lumetra::ShellExt
