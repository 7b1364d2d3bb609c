// Writes to standard output and standard error. Text is written as UTF-8, except to a console window, which
// gets UTF-16.
#pragma once

#include <windows.h>

#include <cstddef>
#include <string>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Show {

/// Returns whether all bytes have been written. If not, GetLastError gives the reason.
bool WriteBytes(HANDLE target, const void* bytes, std::size_t size);

/// Writes to standard output. Like the functions below, it throws Failure if the output cannot be written. A
/// pipe that its reader has closed is not an error.
void Print(std::wstring_view text);

/// Writes UTF-8 to standard output.
void PrintUtf8(std::string_view text);

/// Writes bytes to standard output unchanged.
void PrintBytes(const void* bytes, std::size_t size);

/// Writes a sentence and a line end to standard error.
void PrintError(std::wstring_view sentence);

/// Shows the progress of the work on many files as one line on standard error, if that is a terminal. The
/// line is removed at the end, and before anything else is printed.
class ProgressBar {
 public:
  explicit ProgressBar(std::size_t total);
  ~ProgressBar() { Hide(); }
  ProgressBar(const ProgressBar&) = delete;
  ProgressBar& operator=(const ProgressBar&) = delete;

  void Show(std::size_t done, std::wstring_view name);
  void Hide();

 private:
  std::size_t total_;
  bool enabled_;
  bool shown_ = false;
};

}  // namespace Qel::Lumetra::ShellExt::Show
