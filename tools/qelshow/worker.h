// The process in which the extension runs.
//
// Some requests end their process by design (a colour frame smaller than the request causes a division by
// zero), and any file may trigger an unknown fault. So the program runs the extension in a second process,
// which is the same program started again. If that process ends, its file is reported, and a new process
// answers the next question. The first process never loads the extension.
#pragma once

#include <windows.h>

#include <optional>
#include <string>
#include <utility>

#include "handle_owner.h"
#include "json_records.h"
#include "question.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The argument that makes the program a worker process. It is not for users.
inline constexpr const wchar_t* kWorkerArgument = L"--worker";

/// Runs the worker process: answers questions from standard input until it is closed. Returns the exit
/// status.
int RunWorker();

class Worker {
 public:
  /// Starts a process that loads the DLL at `dllPath`, or the registered one if that is empty. Throws Failure
  /// if the process cannot start or the DLL cannot be loaded.
  explicit Worker(std::wstring dllPath) : dllPath_(std::move(dllPath)) { Start(); }

  /// Fills `answer` and returns nothing. If the process ends instead, returns its exit code and starts a new
  /// process for the next question.
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

  /// Waits for the end of the process, whose pipes are broken. Returns its exit code.
  DWORD Finish();

  std::wstring dllPath_;
  Com::OwnedHandle process_;
  Com::OwnedHandle toProcess_;
  Com::OwnedHandle fromProcess_;
};

}  // namespace Qel::Lumetra::ShellExt::Show
