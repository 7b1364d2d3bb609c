#include "console.h"

#include <algorithm>

#include "failure.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

bool IsConsole(HANDLE handle) {
  DWORD mode = 0;
  return GetConsoleMode(handle, &mode) != 0;
}

/// Returns whether all of the text has been written.
bool PrintTo(DWORD which, std::wstring_view text) {
  const HANDLE target = GetStdHandle(which);
  if (IsConsole(target)) {
    DWORD written = 0;
    return WriteConsoleW(target, text.data(), static_cast<DWORD>(text.size()), &written, nullptr) != 0;
  }
  const std::string utf8 = Utf8(text);
  return WriteBytes(target, utf8.data(), utf8.size());
}

/// Throws Failure if `isWritten` is false, unless nobody reads standard output.
void RequirePrinted(bool isWritten) {
  if (isWritten) return;
  const DWORD error = GetLastError();
  switch (error) {
    case ERROR_BROKEN_PIPE:  // the reader of the pipe has closed it
    case ERROR_NO_DATA:
    case ERROR_PIPE_NOT_CONNECTED:
    case ERROR_INVALID_HANDLE:  // there is no standard output, as in a service
      return;
    default: throw Failure(L"Standard output cannot be written: " + SystemErrorText(error) + L".");
  }
}

}  // namespace

bool WriteBytes(HANDLE target, const void* bytes, std::size_t size) {
  constexpr std::size_t kMaxPart = 1 << 20;
  const char* next = static_cast<const char*>(bytes);
  while (size > 0) {
    DWORD written = 0;
    if (!WriteFile(target, next, static_cast<DWORD>(std::min(size, kMaxPart)), &written, nullptr)) {
      return false;
    }
    next += written;
    size -= written;
  }
  return true;
}

void Print(std::wstring_view text) {
  RequirePrinted(PrintTo(STD_OUTPUT_HANDLE, text));
}

void PrintUtf8(std::string_view text) {
  if (IsConsole(GetStdHandle(STD_OUTPUT_HANDLE))) {
    Print(Wide(text));
  } else {
    PrintBytes(text.data(), text.size());
  }
}

void PrintBytes(const void* bytes, std::size_t size) {
  RequirePrinted(WriteBytes(GetStdHandle(STD_OUTPUT_HANDLE), bytes, size));
}

void PrintError(std::wstring_view sentence) {
  PrintTo(STD_ERROR_HANDLE, std::wstring(sentence) + L"\n");
}

ProgressBar::ProgressBar(std::size_t total)
    : total_(total), enabled_(total > 1 && IsConsole(GetStdHandle(STD_ERROR_HANDLE))) {}

void ProgressBar::Show(std::size_t done, std::wstring_view name) {
  if (!enabled_) return;
  constexpr std::size_t kCells = 30;
  constexpr std::size_t kNameCharacters = 30;
  const std::size_t full = done * kCells / total_;
  std::wstring line = L"\r[" + std::wstring(full, L'=') + std::wstring(kCells - full, L' ') + L"] " +
                      std::to_wstring(done) + L" of " + std::to_wstring(total_) + L"  ";
  name = name.substr(0, kNameCharacters);
  line.append(name).append(kNameCharacters - name.size(), L' ');
  PrintTo(STD_ERROR_HANDLE, line);
  shown_ = true;
}

void ProgressBar::Hide() {
  if (!shown_) return;
  constexpr std::size_t kLineCharacters = 78;
  PrintTo(STD_ERROR_HANDLE, L"\r" + std::wstring(kLineCharacters, L' ') + L"\r");
  shown_ = false;
}

}  // namespace Qel::Lumetra::ShellExt::Show
