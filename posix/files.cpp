// Implements files and strings.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <windows.h>

#include <cwchar>
#include <filesystem>
#include <string>

#include "io.h"

extern "C" {
IMAGE_DOS_HEADER __ImageBase{};
}

// Returns 0 (no string), because native programs have no resources.
int LoadStringW(HINSTANCE, UINT, wchar_t*, int) {
  return 0;
}

// Converts the path to UTF-8, whatever the locale. Returns INVALID_HANDLE_VALUE for a path that UTF-8 cannot
// represent.
HANDLE CreateFileW(const wchar_t* path, DWORD, DWORD, void*, DWORD, DWORD, HANDLE) try {
  const std::filesystem::path name(std::u32string(path, path + std::wcslen(path)));
  const int descriptor = open(name.c_str(), O_RDONLY | O_CLOEXEC);
  struct stat status{};
  if (descriptor == -1) return INVALID_HANDLE_VALUE;
  // Windows does not open folders with these arguments.
  if (fstat(descriptor, &status) != 0 || S_ISDIR(status.st_mode)) {
    close(descriptor);
    return INVALID_HANDLE_VALUE;
  }
  return reinterpret_cast<HANDLE>(std::intptr_t{descriptor});
} catch (const std::filesystem::filesystem_error&) {
  return INVALID_HANDLE_VALUE;
}

BOOL CloseHandle(HANDLE file) {
  return close(static_cast<int>(reinterpret_cast<std::intptr_t>(file))) == 0;
}

int _open_osfhandle(std::intptr_t handle, int) {
  return static_cast<int>(handle);
}

int _close(int descriptor) {
  return close(descriptor);
}
