// The least that reading scattered headers can cost: one call of the system for each of them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Bench {

struct PositionedReads {
  std::int64_t first = 0;  // file offset of the first read, in bytes
  std::int64_t step = 0;   // from one to the next
  std::int64_t count = 0;
  std::size_t bytes = 0;  // of each
};

/// Opens the file and reads; false when it does not hold all bytes.
bool ReadAtPositions(const std::wstring& path, const PositionedReads& reads);

}  // namespace Qel::Lumetra::ShellExt::Bench
