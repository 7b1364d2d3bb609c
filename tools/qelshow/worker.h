// The process in which the extension runs.
//
// Some requests end the process that makes them by design (a colour picture smaller than the request divides
// by zero), and any file may show a fault that nobody knows yet. So the program asks from a second process,
// which is the same program started again: when that one ends, the file at hand is reported and the next
// question gets a new process. The extension is never loaded into the first one.
#pragma once

#include <windows.h>

#include <memory>
#include <optional>
#include <string>
#include <utility>

#include "message.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The argument with which the program starts itself as a worker; not for users.
inline constexpr const wchar_t* kWorkerArgument = L"--worker";

/// The main function of the worker process: answers questions from standard input until it is closed.
int RunWorker();

struct HandleCloser {
  using pointer = HANDLE;
  void operator()(HANDLE handle) const { CloseHandle(handle); }
};
using OwnedHandle = std::unique_ptr<HANDLE, HandleCloser>;

class Worker {
 public:
  /// Starts a process that loads the DLL at `dllPath`, or the registered one if that is empty. Throws Failure
  /// if the process cannot start or the DLL does not load.
  explicit Worker(std::wstring dllPath) : dllPath_(std::move(dllPath)) { Start(); }

  /// Fills `answer`, or answers the code with which the process ended instead; then a new process has been
  /// started for the next question.
  template <class Answer>
  std::optional<DWORD> Ask(const Question& question, Answer& answer) {
    std::string reply;
    if (const auto end = Transmit(Packed(question), reply)) return end;
    answer = Unpacked<Answer>(reply);
    return std::nullopt;
  }

 private:
  void Start();

  std::optional<DWORD> Transmit(const std::string& message, std::string& reply);

  /// Waits for the end of the process, whose pipes are broken, and answers its exit code.
  DWORD Finish();

  std::wstring dllPath_;
  OwnedHandle process_;
  OwnedHandle toProcess_;
  OwnedHandle fromProcess_;
};

}  // namespace Qel::Lumetra::ShellExt::Show
