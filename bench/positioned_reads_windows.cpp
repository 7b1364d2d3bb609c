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
    // Two calls: under Wine one that reads at a position asks its server and takes twenty times as long.
    LARGE_INTEGER position{};
    position.QuadPart = reads.first + i * reads.step;
    DWORD read = 0;
    done = SetFilePointerEx(file, position, nullptr, FILE_BEGIN) &&
           ReadFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &read, nullptr) &&
           read == bytes.size();
  }
  CloseHandle(file);
  return done;
}

}  // namespace Qel::Lumetra::ShellExt::Bench
