#include "doctor.h"

#include <algorithm>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "console.h"
#include "failure.h"
#include "file_inspection.h"
#include "installation.h"
#include "json_records.h"
#include "shell_view.h"
#include "text_tools.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {

static void to_json(Json& json, const ExaminedClass& examined) {
  json = {{"name", examined.name},
          {"class", GuidText(examined.clsid)},
          {"dll", examined.registered.dll},
          {"version", examined.version},
          {"status", StatusText(examined.status)},
          {"problem", examined.problem}};
}

static void to_json(Json& json, const ExaminedHandler& examined) {
  json = {{"role", examined.registered.role},
          {"key", examined.registered.key},
          {"class", examined.registered.registered},
          {"status", StatusText(examined.status)}};
}

static void to_json(Json& json, const ExaminedKind& kind) {
  json = {{"extension", kind.extension}, {"handlers", kind.handlers}, {"leftOut", kind.leftOut}};
}

namespace {

/// Returns the facts about the files, read with the registered extension. If it cannot be loaded, that is the
/// problem of each file.
std::vector<FileFacts> ExamineFiles(const CommandLine& line) {
  std::vector<FileFacts> files;
  std::optional<Worker> worker;
  std::wstring obstacle;
  try {
    if (!line.files.empty()) worker.emplace(std::wstring());
  } catch (const Failure& failure) {
    obstacle = failure.sentence;
  }
  for (const std::wstring& path : line.files) {
    const std::wstring name = std::filesystem::path(path).filename().wstring();
    if (worker) {
      files.push_back(InspectFile(*worker, path, name, line.size));
    } else {
      FileFacts facts;
      facts.path = AbsolutePath(path);
      facts.named = path;
      facts.name = name;
      facts.verdict = Verdict::kFailed;
      facts.problem = obstacle;
      facts.advice = L"First fix the problems listed below.";
      files.push_back(std::move(facts));
    }
  }
  return files;
}

/// Adds a remark to each file whose kind was left out. Returns whether the extension can read any of them.
bool AddRemarksOnLeftOutKinds(const Installation& installation, std::vector<FileFacts>& files) {
  bool isAnyLeftOut = false;
  for (FileFacts& facts : files) {
    const auto kind = std::ranges::find(installation.kinds, L"." + facts.kind, &ExaminedKind::extension);
    if (facts.verdict != Verdict::kGood || kind == installation.kinds.end() || kind->leftOut.empty())
      continue;
    if (!facts.remark.empty()) facts.remark += L" ";
    facts.remark += L"QelShellExt is not registered for " + kind->extension +
                    L" files, so Windows does not use it for this file.";
    isAnyLeftOut = true;
  }
  return isAnyLeftOut;
}

/// Asks the shell about the files that the extension can read and that have no remark. Returns whether it
/// shows what it should for all of them.
bool AskShell(std::vector<FileFacts>& files, std::int32_t size) {
  bool isAsExpected = true;
  std::optional<Worker> worker;
  for (FileFacts& facts : files) {
    if (facts.verdict != Verdict::kGood || !facts.remark.empty()) continue;
    if (!worker) worker.emplace(std::wstring());
    const std::wstring path = AbsolutePath(facts.path);
    ShellView view;
    if (const auto end = worker->Ask({Subject::kShellView, path, size}, view)) {
      facts.shell =
          L"qelshow's worker process crashed while it asked Windows for the thumbnail and the properties: " +
          ProcessEndText(*end) +
          L". Please report this to the developers of QelShellExt, with the file if possible.";
      isAsExpected = false;
    } else {
      facts.shell = ShellText(view, path);
      isAsExpected = isAsExpected && IsAsExpected(view);
    }
  }
  return isAsExpected;
}

Json Document(const Installation& installation, const std::vector<FileFacts>& files) {
  return {{"schema", kJsonSchema},
          {"classes", installation.classes},
          {"kinds", installation.kinds},
          {"problems", installation.problems},
          {"files", files}};
}

std::wstring ClassesText(const std::vector<ExaminedClass>& classes) {
  std::vector<std::vector<std::wstring>> rows = {{L"class", L"status", L"version", L"DLL"}};
  const auto orDash = [](const std::wstring& text) { return text.empty() ? L"-" : text; };
  for (const ExaminedClass& examined : classes) {
    rows.push_back({examined.name, StatusText(examined.status), orDash(examined.version),
                    orDash(examined.registered.dll)});
  }
  return Grid(rows);
}

std::wstring KindsText(const std::vector<ExaminedKind>& kinds) {
  std::vector<std::vector<std::wstring>> rows = {{L"kind"}};
  for (const ExaminedKind& kind : kinds) {
    std::vector<std::wstring> row = {kind.extension};
    for (std::size_t i = 0; i < kind.handlers.size(); ++i) {
      // Every kind has its handlers in the same order; some lack the last.
      if (rows.front().size() == i + 1) rows.front().push_back(kind.handlers[i].registered.role);
      row.emplace_back(StatusText(kind.handlers[i].status));
    }
    rows.push_back(std::move(row));
  }
  return Grid(rows);
}

std::wstring FileText(const FileFacts& facts) {
  std::wstring text = L"    " + facts.named + L": ";
  if (facts.verdict != Verdict::kGood)
    return text + L"no thumbnail. " + facts.problem + L"\n      " + facts.advice + L"\n";
  text += L"can be read: " + std::to_wstring(facts.width) + L" x " + std::to_wstring(facts.height) +
          L" pixels, " + std::to_wstring(facts.frames) + (facts.frames == 1 ? L" frame, " : L" frames, ") +
          facts.type + L"\n";
  for (const auto& sentence : {facts.remark, facts.shell}) {
    if (!sentence.empty()) text += L"      " + sentence + L"\n";
  }
  return text;
}

std::wstring Text(const Installation& installation, const std::vector<FileFacts>& files) {
  std::wstring text =
      L"Classes\n" + ClassesText(installation.classes) + L"\nHandlers\n" + KindsText(installation.kinds);
  if (!files.empty()) text += L"\nFiles\n";
  for (const FileFacts& facts : files) text += FileText(facts);
  std::wstring leftOut;
  for (const ExaminedKind& kind : installation.kinds) {
    if (!kind.leftOut.empty()) leftOut += L"    " + kind.leftOut + L"\n";
  }
  if (!leftOut.empty()) text += L"\nUnregistered file kinds (not a problem if intended)\n" + leftOut;
  if (installation.problems.empty()) return text + L"\nQelShellExt is registered and can be loaded.\n";
  text += L"\nProblems\n";
  for (const std::wstring& problem : installation.problems) text += L"    " + problem + L"\n";
  return text;
}

}  // namespace

int RunDoctor(const CommandLine& line) {
  const Installation installation = ExamineInstallation();
  std::vector<FileFacts> files = ExamineFiles(line);
  const bool isAnyLeftOut = AddRemarksOnLeftOutKinds(installation, files);
  const bool isShown = AskShell(files, line.size);
  if (line.json) {
    PrintUtf8(Document(installation, files).dump() + "\n");
  } else {
    Print(Text(installation, files));
  }
  int status = installation.problems.empty() && !isAnyLeftOut && isShown ? kExitDone : kExitFailed;
  for (const FileFacts& facts : files) status = std::max(status, static_cast<int>(facts.verdict));
  return status;
}

}  // namespace Qel::Lumetra::ShellExt::Show
