// How the extension is installed on this computer: follows every way on which the shell comes to it, from a
// kind of file to its handler, the class, the DLL, an object of the class, and judges each step. The doctor
// shows what is found.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "file_facts.h"
#include "registered_handlers.h"

namespace Qel::Lumetra::ShellExt::Show {

/// How far the way goes.
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

/// A few words, for tables and JSON.
std::wstring ConditionText(Condition condition);

/// One of the extension's classes.
struct ExaminedClass {
  std::wstring name;  // what it does
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
  // A sentence for the user, if nothing at all of the extension is registered for this kind, as when it was
  // left to other programs at the installation. That is no problem.
  OptionalText leftOut;
};

struct Installation {
  std::vector<ExaminedClass> classes;
  std::vector<ExaminedKind> kinds;
  std::vector<std::wstring> problems;  // sentences, each for another thing that is wrong and what to do
};

/// Loads the DLL in another process only.
Installation ExamineInstallation();

}  // namespace Qel::Lumetra::ShellExt::Show
