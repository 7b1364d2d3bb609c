#include "installation.h"

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <map>

#include "class_ids.h"
#include "failure.h"
#include "same_text.h"
#include "shell_obstacles.h"
#include "text_tools.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

bool FileExists(const std::wstring& path) {
  return !path.empty() && GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES;
}

/// Returns advice with the command that registers the extension: the registered DLL, or else the DLL in this
/// program's folder. What Windows Installer has installed, it must also repair: regsvr32 would register the
/// kinds that were left out too, and the installer would not remove those.
std::wstring RegisterAdvice(const std::wstring& registeredDll) {
  const std::wstring product = InstalledProduct();
  if (!product.empty()) return L"run msiexec /i " + product + L" REINSTALL=ALL as administrator";
  std::wstring dll = registeredDll;
  if (!FileExists(dll)) dll = std::filesystem::path(OwnPath()).replace_filename(L"QelShellExt.dll").wstring();
  return FileExists(dll) ? L"run regsvr32 \"" + dll + L"\" as administrator"
                         : L"run regsvr32 with the path of QelShellExt.dll as administrator, or reinstall "
                           L"QelShellExt";
}

/// Returns advice with the command that registers a file kind that was left out. The installer's name for a
/// kind is its file-name extension without the dot.
std::wstring AddAdvice(const std::wstring& extension, const std::wstring& registeredDll) {
  const std::wstring product = InstalledProduct();
  if (product.empty()) return RegisterAdvice(registeredDll);
  return L"run msiexec /i " + product + L" ADDLOCAL=" + extension.substr(1) + L" as administrator";
}

constexpr const wchar_t* kReinstall = L" Reinstall QelShellExt.";

/// Worker processes, by the path of the DLL that they have loaded.
using Workers = std::map<std::wstring, Worker>;

/// Loads the DLL and creates an object, both in a worker process, because either may crash.
void ExamineObject(ExaminedClass& examined, Workers& workers) {
  const std::wstring& dll = examined.registered.dll;
  examined.status = Status::kDllNotLoaded;
  try {
    Worker& worker = workers.try_emplace(dll, dll).first->second;
    examined.status = Status::kObjectNotCreated;
    if (const auto end = worker.Ask({Subject::kCreation, GuidText(examined.clsid)}, examined.problem)) {
      examined.problem = L"The DLL \"" + dll + L"\" crashes when it creates the " + examined.name +
                         L" object: " + ProcessEndText(*end) + L".";
    }
  } catch (const Failure& failure) {
    examined.problem = failure.sentence;
  }
  if (examined.problem.empty()) {
    examined.status = Status::kWorks;
  } else {
    examined.problem += kReinstall;
  }
}

/// Finds what prevents the shell from using a class that other programs can use.
void ExamineUse(ExaminedClass& examined, const std::wstring& id) {
  const RegisteredClass& registered = examined.registered;
  const std::wstring subject = L"The " + examined.name;
  if (!registered.blocked.empty()) {
    examined.status = Status::kBlocked;
    examined.problem = subject + L" is in Windows' list of blocked shell extensions: delete the value " + id +
                       L" from " + registered.blocked + L".";
  } else if (registered.isUnapproved) {
    examined.status = Status::kUnapproved;
    examined.problem = subject + L", " + id +
                       L", is not in the list of approved shell extensions, and a policy allows no others: " +
                       RegisterAdvice(registered.dll) + L".";
  } else if (!SameIgnoringCase(registered.threadingModel, L"Apartment") &&
             !SameIgnoringCase(registered.threadingModel, L"Both")) {
    examined.status = Status::kThreading;
    examined.problem = subject + L" is registered with the ThreadingModel \"" + registered.threadingModel +
                       L"\" instead of \"Apartment\" or \"Both\": " + RegisterAdvice(registered.dll) + L".";
  }
}

ExaminedClass ExamineClass(const wchar_t* name, const CLSID& clsid, Workers& workers) {
  const std::wstring id = GuidText(clsid);
  ExaminedClass examined;
  examined.name = name;
  examined.clsid = clsid;
  examined.registered = ReadClass(id);
  const std::wstring& dll = examined.registered.dll;
  if (dll.empty()) {
    examined.status = Status::kNotRegistered;
    examined.problem =
        L"The " + examined.name + L", " + id +
        (examined.registered.exists ? L", is registered, but without a DLL: " : L", is not registered: ") +
        RegisterAdvice({}) + L".";
  } else if (!FileExists(dll)) {
    const std::wstring reason = SystemErrorText(GetLastError());
    examined.status = Status::kDllNotFound;
    examined.problem = L"The registered DLL \"" + dll + L"\" cannot be found (" + reason +
                       L"): put it back, or " + RegisterAdvice({}) + L".";
  } else {
    examined.version = FileVersion(dll);
    ExamineObject(examined, workers);
  }
  if (examined.status == Status::kWorks) ExamineUse(examined, id);
  return examined;
}

const ExaminedClass& FindClass(const std::vector<ExaminedClass>& classes, const CLSID& clsid) {
  return *std::ranges::find(classes, clsid, &ExaminedClass::clsid);
}

/// Returns the status of a handler, which is that of its class if the class is the extension's.
Status StatusOf(const Handler& handler, const std::vector<ExaminedClass>& classes) {
  if (handler.registered.empty()) return Status::kNotRegistered;
  if (!SameIgnoringCase(handler.registered, GuidText(handler.expected))) return Status::kForeign;
  return FindClass(classes, handler.expected).status;
}

/// Describes another program's class by its registry entries.
std::wstring ForeignClassText(const std::wstring& clsid) {
  const RegisteredClass foreign = ReadClass(clsid);
  std::wstring text = L"class " + clsid;
  if (!foreign.title.empty()) text += L" (" + foreign.title + L")";
  if (!foreign.dll.empty()) text += L" in \"" + foreign.dll + L"\"";
  return text;
}

std::wstring ForeignHandlerProblem(const std::wstring& extension, const Handler& handler,
                                   const std::wstring& advice) {
  const std::wstring text = L"Another program provides the " + handler.role + L" of " + extension +
                            L" files: " + ForeignClassText(handler.registered) + L", registered in " +
                            handler.key;
  return handler.isOwnKey
             ? text + L". To use QelShellExt instead, " + advice + L"."
             : text +
                   L", which takes precedence over QelShellExt. To use QelShellExt instead, delete this key "
                   L"or, if it belongs to the default program for " +
                   extension + L" files, choose another default program.";
}

std::wstring MissingHandlersProblem(const ExaminedKind& kind, const std::wstring& advice) {
  std::wstring roles;
  for (const ExaminedHandler& handler : kind.handlers) {
    if (handler.status != Status::kNotRegistered || !handler.registered.registered.empty()) continue;
    roles += (roles.empty() ? L"" : L", ") + handler.registered.role;
  }
  if (roles.empty()) return {};
  return L"The registration for " + kind.extension + L" files is incomplete (missing: " + roles + L"): " +
         advice + L".";
}

/// Returns whether nothing of the extension is registered for this kind: it has no handler of the extension,
/// and the class that serves only this kind does not exist.
bool HasNothing(const ExaminedKind& kind, const std::vector<ExaminedClass>& classes) {
  return std::ranges::none_of(kind.handlers, [&](const ExaminedHandler& examined) {
    const Handler& handler = examined.registered;
    return SameIgnoringCase(handler.registered, GuidText(handler.expected)) ||
           (handler.expected != CLSID_QelShellExt && FindClass(classes, handler.expected).registered.exists);
  });
}

/// Finds the file kinds that were left out: the extension is registered, but not for these kinds.
void FindLeftOut(Installation& installation) {
  const ExaminedClass& extension = FindClass(installation.classes, CLSID_QelShellExt);
  const auto hasNothing = [&](const ExaminedKind& kind) { return HasNothing(kind, installation.classes); };
  if (!extension.registered.exists || std::ranges::all_of(installation.kinds, hasNothing)) return;
  for (ExaminedKind& kind : installation.kinds) {
    if (!hasNothing(kind)) continue;
    std::wstring text = L"QelShellExt is not registered for " + kind.extension + L" files.";
    for (const auto& [handler, status] : kind.handlers) {
      if (status != Status::kForeign) continue;
      text += L" Another program provides their " + handler.role + L": " +
              ForeignClassText(handler.registered) + L".";
      break;
    }
    kind.leftOut = text + L" To register it, " + AddAdvice(kind.extension, extension.registered.dll) + L".";
  }
}

std::vector<std::wstring> FindProblems(const Installation& installation) {
  const auto isMissing = [](const auto& examined) { return examined.status == Status::kNotRegistered; };
  const auto isBare = [&](const ExaminedKind& kind) { return std::ranges::all_of(kind.handlers, isMissing); };
  const auto& classes = installation.classes;
  const std::wstring advice = RegisterAdvice(classes.front().registered.dll);
  if (std::ranges::all_of(classes, isMissing) && std::ranges::all_of(installation.kinds, isBare)) {
    return {L"QelShellExt is not registered on this computer: " + advice + L"."};
  }

  std::vector<std::wstring> problems;
  const auto add = [&](const std::wstring& problem) {
    // A fault of the DLL is reported once, although each of its classes has it.
    if (!problem.empty() && std::ranges::find(problems, problem) == problems.end())
      problems.push_back(problem);
  };
  const auto isLeftOut = [&](const ExaminedClass& examined) {
    return std::ranges::any_of(installation.kinds, [&](const ExaminedKind& kind) {
      return !kind.leftOut.empty() && kind.handlers.back().registered.expected == examined.clsid;
    });
  };
  for (const ExaminedClass& examined : classes) {
    if (examined.clsid == CLSID_QelShellExt || !isLeftOut(examined)) add(examined.problem);
  }
  for (const ExaminedKind& kind : installation.kinds) {
    if (!kind.leftOut.empty()) continue;
    add(MissingHandlersProblem(kind, advice));
    for (const auto& [handler, status] : kind.handlers) {
      if (status == Status::kForeign) add(ForeignHandlerProblem(kind.extension, handler, advice));
    }
  }
  return problems;
}

}  // namespace

std::wstring StatusText(Status status) {
  switch (status) {
    case Status::kWorks: return L"works";
    case Status::kNotRegistered: return L"not registered";
    case Status::kForeign: return L"another program";
    case Status::kDllNotFound: return L"DLL not found";
    case Status::kDllNotLoaded: return L"DLL not loaded";
    case Status::kObjectNotCreated: return L"object not created";
    case Status::kBlocked: return L"blocked";
    case Status::kUnapproved: return L"not approved";
    case Status::kThreading: return L"wrong ThreadingModel";
  }
  return {};
}

Installation ExamineInstallation() {
  Workers workers;
  Installation installation;
  installation.classes = {ExamineClass(L"shell extension", CLSID_QelShellExt, workers),
                          ExamineClass(L".ebn property store", CLSID_QelShellExtVistaEbn, workers),
                          ExamineClass(L".raw property store", CLSID_QelShellExtVistaRaw, workers),
                          ExamineClass(L".mrc property store", CLSID_QelShellExtVistaMrc, workers)};
  for (const KindOfFile& kind : ReadHandlers()) {
    ExaminedKind examined{kind.extension, {}, {}};
    for (const Handler& handler : kind.handlers) {
      examined.handlers.push_back({handler, StatusOf(handler, installation.classes)});
    }
    installation.kinds.push_back(std::move(examined));
  }
  FindLeftOut(installation);
  installation.problems = FindProblems(installation);
  std::ranges::move(FindSettingsThatHideThumbnails(), std::back_inserter(installation.problems));
  return installation;
}

}  // namespace Qel::Lumetra::ShellExt::Show
