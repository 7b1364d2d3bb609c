#include "commands.h"

#include <windows.h>

#include <algorithm>
#include <filesystem>

#include "console.h"
#include "failure.h"
#include "file_inspection.h"
#include "file_list.h"
#include "json_records.h"
#include "output.h"
#include "page_writer.h"
#include "reports.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

int ExitStatus(Verdict verdict) {
  return static_cast<int>(verdict);
}

std::wstring FileName(const std::wstring& path) {
  return std::filesystem::path(path).filename().wstring();
}

/// Prints a file's problem and remark, if any, to standard error.
void PrintProblem(const FileFacts& facts) {
  if (!facts.problem.empty()) PrintError(facts.named + L": " + facts.problem + L" " + facts.advice);
  if (!facts.remark.empty()) PrintError(facts.named + L": " + facts.remark);
}

/// Starts a worker process with the extension that the command line names.
Worker StartWorker(const CommandLine& line) {
  try {
    return Worker(line.server);
  } catch (const Failure& failure) {
    if (!line.server.empty()) throw;
    throw Failure(failure.sentence +
                  L" Run \"qelshow doctor\" to find out what to do, or name a DLL with --server.");
  }
}

}  // namespace

int RunInfo(const CommandLine& line) {
  Worker worker = StartWorker(line);
  ProgressBar progress(line.files.size());
  int status = kExitDone;
  std::size_t count = 0;
  std::size_t printed = 0;
  if (line.json) PrintUtf8("{\"schema\":" + std::to_string(kJsonSchema) + ",\"files\":[");
  for (const std::wstring& path : line.files) {
    progress.Show(count, FileName(path));
    const FileFacts facts = InspectFile(worker, path, FileName(path), line.size);
    progress.Hide();
    if (line.json) {
      PrintUtf8((count > 0 ? ",\n" : "\n") + Json(facts).dump());
    } else if (facts.verdict == Verdict::kGood || facts.verdict == Verdict::kNoThumbnail) {
      Print((printed++ > 0 ? L"\n" : L"") + TextReport(facts));
    }
    if (facts.verdict != Verdict::kGood) PrintProblem(facts);
    status = std::max(status, ExitStatus(facts.verdict));
    ++count;
  }
  if (line.json) PrintUtf8("\n]}\n");
  return status;
}

int RunThumbnail(const CommandLine& line) {
  const std::wstring& path = line.files.front();
  const bool isToFile = line.out != L"-";
  if (isToFile) CheckPngOutput(line.out, path);
  Worker worker = StartWorker(line);
  const FileFacts facts = InspectFile(worker, path, FileName(path), line.size);
  PrintProblem(facts);
  const auto& png = facts.png;
  if (png.empty()) return ExitStatus(facts.verdict);
  if (isToFile) {
    ReplaceFileAt(line.out, png);
  } else {
    PrintBytes(png.data(), png.size());
  }
  return kExitDone;
}

int RunPage(const CommandLine& line) {
  const auto [folder, files] = ListFiles(line.files);
  CheckPageOutput(line.out, files.size());
  Worker worker = StartWorker(line);
  PageWriter page(line.out, folder);
  constexpr std::size_t kMaxNameWidth = 40;
  std::size_t nameWidth = 4;
  for (const ListedFile& file : files) nameWidth = std::max(nameWidth, file.name.size());
  nameWidth = std::min(nameWidth, kMaxNameWidth);

  Print(TableHeading(nameWidth));
  ProgressBar progress(files.size());
  std::size_t count = 0;
  std::size_t thumbnails = 0;
  for (const ListedFile& file : files) {
    progress.Show(count++, file.name);
    const FileFacts facts = InspectFile(worker, file.path, file.name, line.size);
    page.Add(facts);
    if (!facts.png.empty()) ++thumbnails;
    progress.Hide();
    Print(TableRow(facts, nameWidth));
  }
  page.Finish();
  Print(L"\n" + page.path() + L": " + std::to_wstring(files.size()) +
        (files.size() == 1 ? L" file, " : L" files, ") + std::to_wstring(thumbnails) +
        L" with a thumbnail\n");
  return kExitDone;
}

}  // namespace Qel::Lumetra::ShellExt::Show
