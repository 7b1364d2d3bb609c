#include "path_stream.h"

#include <fcntl.h>
#include <io.h>
#include <windows.h>

#include <cstdint>
#include <ext/stdio_filebuf.h>

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr auto kMode = std::ios_base::in | std::ios_base::binary;

// Large enough to read any header at once, and no larger: the buffer is refilled after each seek, so a larger
// one would slow down reading the headers of many elements.
constexpr std::size_t kBufferBytes = 2048;

/// Returns an open file descriptor, or -1 on failure.
int OpenShared(const wchar_t* path) {
  const HANDLE file = CreateFileW(path, GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                                  nullptr, OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr);
  if (file == INVALID_HANDLE_VALUE) return -1;
  const int descriptor = _open_osfhandle(reinterpret_cast<std::intptr_t>(file), _O_RDONLY | _O_BINARY);
  if (descriptor == -1) CloseHandle(file);
  return descriptor;
}

}  // namespace

void OpenPath(std::ifstream& stream, const wchar_t* path) {
  if (!stream.is_open()) {
    // The standard library opens files without FILE_SHARE_DELETE, so the descriptor is opened here and handed
    // to the stream's file buffer.
    if (const int descriptor = OpenShared(path); descriptor != -1) {
      *stream.rdbuf() = __gnu_cxx::stdio_filebuf<char>(descriptor, kMode, kBufferBytes);
      if (stream.is_open()) {
        stream.clear();
        return;
      }
      _close(descriptor);
    }
  }
  stream.setstate(std::ios_base::failbit);
}

}  // namespace Qel::Lumetra::ShellExt
