// Examines how the extension is installed on this computer. It follows the path by which the shell reaches
// the extension, from a file kind to its handler, the class, the DLL and an object of the class, and checks
// each step. The doctor shows the result.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "file_facts.h"
#include "registered_handlers.h"

namespace Qel::Lumetra::ShellExt::Show {

/// How far the shell gets on this path.
enum class Status {
  kWorks,
  kNotRegistered,
  kForeign,
  kDllNotFound,
  kDllNotLoaded,
  kObjectNotCreated,
  kBlocked,
  kUnapproved,
  kThreading
};

/// Returns the status in a few words, for tables and JSON.
std::wstring StatusText(Status status);

/// One of the extension's classes.
struct ExaminedClass {
  std::wstring name;  // its purpose
  CLSID clsid{};
  RegisteredClass registered;
  OptionalText version;  // of the DLL
  Status status = Status::kWorks;
  OptionalText problem;  // a sentence for the user
};

struct ExaminedHandler {
  Handler registered;
  Status status = Status::kWorks;
};

struct ExaminedKind {
  std::wstring extension;
  std::vector<ExaminedHandler> handlers;
  // Text for the user if the extension is registered, but not for this kind, because it was left out of the
  // installation; otherwise empty. This is not a problem.
  OptionalText leftOut;
};

struct Installation {
  std::vector<ExaminedClass> classes;
  std::vector<ExaminedKind> kinds;
  std::vector<std::wstring> problems;  // each says what is wrong and what to do
};

/// Examines the installation. It loads the DLL only in other processes.
Installation ExamineInstallation();

}  // namespace Qel::Lumetra::ShellExt::Show
