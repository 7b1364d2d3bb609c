// Whether an object has let go of its file.
#pragma once

#include <windows.h>

#include <filesystem>

namespace Qel::Lumetra::ShellExt::Testing {

/// Whether nobody has the file open. A scanner of the system, which may have it for a moment, is waited for.
inline bool IsUnused(const std::filesystem::path& file) {
  for (int i = 0; i < 100; ++i) {
    const HANDLE handle = CreateFileW(file.c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, 0, nullptr);
    if (handle != INVALID_HANDLE_VALUE) {
      CloseHandle(handle);
      return true;
    }
    Sleep(10);
  }
  return false;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
