// The exception that ends a command.
#pragma once

#include <string>
#include <utility>

namespace Qel::Lumetra::ShellExt::Show {

// Exit statuses of the program, in addition to the verdicts of files (file_facts.h).
inline constexpr int kExitDone = 0;
inline constexpr int kExitFailed = 1;
inline constexpr int kExitUsage = 2;

/// Contains a sentence for the user, which names the file or argument concerned.
struct Failure {
  explicit Failure(std::wstring what, int status = kExitFailed)
      : sentence(std::move(what)), exitStatus(status) {}

  std::wstring sentence;
  int exitStatus;
};

}  // namespace Qel::Lumetra::ShellExt::Show
