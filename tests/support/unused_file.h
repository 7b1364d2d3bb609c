// Reports whether an object has closed its file.
#pragma once

#include <windows.h>

#include <filesystem>

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns whether nobody has the file open. It retries for a while, as a virus scanner may hold the file
/// briefly.
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
