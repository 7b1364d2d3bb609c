// Writes .mrc, .ali and .rec files.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "file_bytes.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct MrcFile {
  std::int32_t nx = 1;
  std::int32_t ny = 1;
  std::int32_t nz = 1;
  std::int32_t mode = 0;
  std::optional<std::int32_t> next{};          // default: the bytes of `extendedHeader`
  std::optional<std::int32_t> nlabl{};         // default: the number of `labels`
  std::vector<std::string> labels{};           // of at most 80 bytes each, padded with zeros
  ByteOrder order = ByteOrder::kLittleEndian;  // of the header
  std::string extendedHeader{};
  std::string pixels{};  // in file order: the bottom row of section 0 first

  std::string Bytes() const;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
