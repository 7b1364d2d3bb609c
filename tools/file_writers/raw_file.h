// Writes .raw files.
#pragma once

#include <cstdint>
#include <string>

#include "data_type.h"
#include "file_bytes.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct RawFile {
  std::string magic{"QEL RawImage\0", 13};
  std::int32_t word1 = 1;
  std::int32_t width = 1;
  std::int32_t height = 1;
  std::int32_t word4 = 1;
  std::int32_t bitsPerPixel = 8;
  std::int32_t valueClass = 0;
  std::int32_t offset = 0;
  std::int32_t pixelStride = 1;
  std::int32_t rowStride = 1;
  std::string pixels{};  // the bytes after the header

  std::string Bytes() const;
};

/// Returns a file whose rows are contiguous, without padding. `type` must be a listed type.
RawFile PackedRawFile(DataType type, std::int32_t width, std::int32_t height, std::string pixels);

}  // namespace Qel::Lumetra::ShellExt::Testing
