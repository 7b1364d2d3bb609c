// Standard output and standard error: text as UTF-8, or as it is to a console window.
#pragma once

#include <windows.h>

#include <cstddef>
#include <string>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Show {

/// Answers whether all bytes were taken; the system's last error says why not.
bool WriteBytes(HANDLE target, const void* bytes, std::size_t size);

/// Writes to standard output. Throws Failure if it cannot be written, here and below; that nobody reads it,
/// or not to its end, is not an error of this program.
void Print(std::wstring_view text);

/// Writes UTF-8 to standard output.
void PrintUtf8(std::string_view text);

/// Writes bytes to standard output as they are.
void PrintBytes(const void* bytes, std::size_t size);

/// Writes a sentence and a line end to standard error.
void PrintError(std::wstring_view sentence);

/// How far the work on many files has come: one line on standard error, if that is a terminal. The line is
/// taken away before anything else is printed and at the end.
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
