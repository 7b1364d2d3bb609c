// Examines how the extension is installed on this computer. It follows each path by which the shell reaches
// the extension, from a file kind to its handler, the class, the DLL and an object of the class, and judges
// each step. The doctor shows the result.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "file_facts.h"
#include "registered_handlers.h"

namespace Qel::Lumetra::ShellExt::Show {

/// How far the shell gets on such a path.
enum class Condition {
  kWorks,
  kNotRegistered,
  kForeign,
  kDllNotFound,
  kDllNotLoaded,
  kNoObject,
  kBlocked,
  kUnapproved,
  kThreading
};

/// Returns a few words for tables and JSON.
std::wstring ConditionText(Condition condition);

/// One of the extension's classes.
struct ExaminedClass {
  std::wstring name;  // its purpose
  CLSID clsid{};
  RegisteredClass registered;
  OptionalText version;  // of the DLL
  Condition condition = Condition::kWorks;
  OptionalText problem;  // a sentence for the user
};

struct ExaminedHandler {
  Handler registered;
  Condition condition = Condition::kWorks;
};

struct ExaminedKind {
  std::wstring extension;
  std::vector<ExaminedHandler> handlers;
  // A sentence for the user if nothing of the extension is registered for this kind, because the installation
  // has left it to other programs. This is not a problem.
  OptionalText leftOut;
};

struct Installation {
  std::vector<ExaminedClass> classes;
  std::vector<ExaminedKind> kinds;
  std::vector<std::wstring> problems;  // a sentence for each fault, with what to do about it
};

/// Examines the installation. It loads the DLL only in other processes.
Installation ExamineInstallation();

}  // namespace Qel::Lumetra::ShellExt::Show
