// Files, on POSIX.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <windows.h>

#include <string>

#include "io.h"

extern "C" {
IMAGE_DOS_HEADER __ImageBase{};
}

// Native programs carry no resources.
int LoadStringW(HINSTANCE, UINT, wchar_t*, int) {
  return 0;
}

namespace {

/// Wide paths are UTF-32 here and UTF-8 on disk.
std::string Utf8(const wchar_t* wide) {
  std::string narrow;
  for (; *wide != L'\0'; ++wide) {
    const auto code = static_cast<std::uint32_t>(*wide);
    const auto put = [&narrow](std::uint32_t byte) { narrow.push_back(static_cast<char>(byte)); };
    if (code < 0x80) {
      put(code);
    } else if (code < 0x800) {
      put(0xC0 | (code >> 6));
      put(0x80 | (code & 0x3F));
    } else if (code < 0x10000) {
      put(0xE0 | (code >> 12));
      put(0x80 | ((code >> 6) & 0x3F));
      put(0x80 | (code & 0x3F));
    } else {
      put(0xF0 | (code >> 18));
      put(0x80 | ((code >> 12) & 0x3F));
      put(0x80 | ((code >> 6) & 0x3F));
      put(0x80 | (code & 0x3F));
    }
  }
  return narrow;
}

}  // namespace

HANDLE CreateFileW(const wchar_t* path, DWORD, DWORD, void*, DWORD, DWORD, HANDLE) {
  const int descriptor = open(Utf8(path).c_str(), O_RDONLY | O_CLOEXEC);
  struct stat status{};
  if (descriptor == -1) return INVALID_HANDLE_VALUE;
  // The platform opens no folders this way.
  if (fstat(descriptor, &status) != 0 || S_ISDIR(status.st_mode)) {
    close(descriptor);
    return INVALID_HANDLE_VALUE;
  }
  return reinterpret_cast<HANDLE>(std::intptr_t{descriptor});
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
