// The process in which the extension runs.
//
// Some requests end the process that makes them by design (a colour picture smaller than the request divides
// by zero), and any file may show a fault that nobody knows yet. So the program asks from a second process,
// which is the same program started again: when that one ends, the file at hand is reported and the next
// question gets a new process. The extension is never loaded into the first one.
#pragma once

#include <windows.h>

#include <optional>
#include <string>
#include <utility>

#include "handle_owner.h"
#include "json_records.h"
#include "question.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The argument with which the program starts itself as a worker; not for users.
inline constexpr const wchar_t* kWorkerArgument = L"--worker";

/// The main function of the worker process: answers questions from standard input until it is closed.
int RunWorker();

class Worker {
 public:
  /// Starts a process that loads the DLL at `dllPath`, or the registered one if that is empty. Throws Failure
  /// if the process cannot start or the DLL does not load.
  explicit Worker(std::wstring dllPath) : dllPath_(std::move(dllPath)) { Start(); }

  /// Fills `answer`, or answers the code with which the process ended instead; then a new process has been
  /// started for the next question.
  template <class Answer>
  std::optional<DWORD> Ask(const Question& question, Answer& answer) {
    Json reply;
    if (const auto end = Transmit(question, reply)) return end;
    reply.get_to(answer);
    return std::nullopt;
  }

 private:
  void Start();

  /// Returns whether the process has answered.
  bool Exchange(const Question& question, Json& reply);

  std::optional<DWORD> Transmit(const Question& question, Json& reply);

  /// Waits for the end of the process, whose pipes are broken, and answers its exit code.
  DWORD Finish();

  std::wstring dllPath_;
  Com::OwnedHandle process_;
  Com::OwnedHandle toProcess_;
  Com::OwnedHandle fromProcess_;
};

}  // namespace Qel::Lumetra::ShellExt::Show
