// Writes .ebn files.
#pragma once

#include <cstdint>
#include <string>

#include "file_bytes.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct EbnFile {
  std::uint16_t typeCode = 1;  // 1 to 6: unsigned, then signed, of 8, 16 and 32 bits; 7 float; 8 double
  std::int32_t width = 1;
  std::int32_t height = 1;
  std::int32_t dataOffset = 54;
  double model = 0;
  double source = 0;
  double lens = 0;
  double dNumber = 0;
  double kilovolts = 0;
  std::string afterHeader{};  // the pixels, and any bytes between the header and `dataOffset`

  std::string Bytes() const;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
