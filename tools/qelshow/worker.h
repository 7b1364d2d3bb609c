// The process in which the extension runs.
//
// Some requests crash the process by design (a colour frame smaller than the request causes a division by
// zero), and any file may trigger an unknown fault. So the program runs the extension in a worker process: a
// second instance of itself. If that process crashes, the program reports the file and starts a new process
// for the next question. The first process never loads the extension.
#pragma once

#include <windows.h>

#include <optional>
#include <string>
#include <utility>

#include "handle_owner.h"
#include "json_records.h"
#include "question.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The argument that makes the program a worker process. Users do not need it.
inline constexpr const wchar_t* kWorkerArgument = L"--worker";

/// Runs the worker process: answers questions from standard input until it is closed. Returns the exit
/// status.
int RunWorker();

class Worker {
 public:
  /// Starts a process that loads the DLL at `dllPath`, or the registered one if that is empty. Throws Failure
  /// if the process cannot start or the DLL cannot be loaded.
  explicit Worker(std::wstring dllPath) : dllPath_(std::move(dllPath)) { Start(); }

  /// Fills `answer` and returns nothing. If the process crashes, returns its exit code and starts a new
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

  /// Sends the question and receives the reply. Returns false if the process has crashed.
  bool Exchange(const Question& question, Json& reply);

  /// Does the work of Ask, with the reply as JSON.
  std::optional<DWORD> Transmit(const Question& question, Json& reply);

  /// Waits for the end of the process, whose pipes are broken. Returns its exit code.
  DWORD Finish();

  std::wstring dllPath_;
  Com::OwnedHandle process_;
  Com::OwnedHandle toProcess_;
  Com::OwnedHandle fromProcess_;
};

}  // namespace Qel::Lumetra::ShellExt::Show
