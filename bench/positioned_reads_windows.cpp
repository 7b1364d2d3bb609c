#include "positioned_reads.h"

#include <windows.h>

#include <vector>

namespace Qel::Lumetra::ShellExt::Bench {

bool ReadAtPositions(const std::wstring& path, const PositionedReads& reads) {
  const HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
  if (file == INVALID_HANDLE_VALUE) return false;
  std::vector<char> bytes(reads.bytes);
  bool done = true;
  for (std::int64_t i = 0; i < reads.count && done; ++i) {
    const std::int64_t position = reads.first + i * reads.step;
    OVERLAPPED place{};
    place.Offset = static_cast<DWORD>(position);
    place.OffsetHigh = static_cast<DWORD>(position >> 32);
    DWORD read = 0;
    done =
        ReadFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &read, &place) && read == bytes.size();
  }
  CloseHandle(file);
  return done;
}

}  // namespace Qel::Lumetra::ShellExt::Bench
