// qelshow: shows what Windows gets from the extension for a file.
#include <exception>
#include <string>
#include <vector>

#include "command_line.h"
#include "commands.h"
#include "console.h"
#include "doctor.h"
#include "failure.h"
#include "text_tools.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

int Run(const CommandLine& line) {
  switch (line.command) {
    case Command::kHelp: Print(line.helpText); return kExitDone;
    case Command::kInfo: return RunInfo(line);
    case Command::kThumbnail: return RunThumbnail(line);
    case Command::kPage: return RunPage(line);
    case Command::kDoctor: return RunDoctor(line);
  }
  return kExitUsage;
}

int Main(const std::vector<std::wstring>& arguments) {
  if (arguments.size() == 1 && arguments.front() == kWorkerArgument) return RunWorker();
  try {
    return Run(ParseCommandLine(arguments));
  } catch (const Failure& failure) {
    PrintError(L"qelshow: " + failure.sentence);
    return failure.exitStatus;
  } catch (const std::exception& e) {
    PrintError(L"qelshow: " + Wide(e.what()));
    return kExitFailed;
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show

/// Makes the C runtime of mingw-w64 replace patterns on the command line with the files that they match. The
/// command interpreters of Windows leave this to the programs.
int _dowildcard = -1;

int wmain(int count, wchar_t** arguments) {
  return Qel::Lumetra::ShellExt::Show::Main({arguments + 1, arguments + count});
}
