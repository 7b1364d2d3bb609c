// The end of a command that cannot be carried out.
#pragma once

#include <string>
#include <utility>

namespace Qel::Lumetra::ShellExt::Show {

// Exit statuses of the program, beside those of a file's verdict (file_facts.h).
inline constexpr int kExitDone = 0;
inline constexpr int kExitFailed = 1;
inline constexpr int kExitUsage = 2;

/// Thrown with a sentence for the user, which names what it is about.
struct Failure {
  explicit Failure(std::wstring what, int status = kExitFailed)
      : sentence(std::move(what)), exitStatus(status) {}

  std::wstring sentence;
  int exitStatus;
};

}  // namespace Qel::Lumetra::ShellExt::Show
