// The command line: what the program is asked to do, and the texts of its help.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

enum class Command { kHelp, kInfo, kThumbnail, kPage, kDoctor };

struct CommandLine {
  Command command = Command::kHelp;
  std::wstring helpText;  // or the version, for kHelp
  std::vector<std::wstring> files;
  std::wstring server;  // empty: the registered one
  std::wstring out;     // a file or a folder
  std::int32_t size = 256;
  bool json = false;
};

/// `arguments` without the program's name. Throws Failure for a command line that cannot be carried out.
CommandLine ParseCommandLine(const std::vector<std::wstring>& arguments);

}  // namespace Qel::Lumetra::ShellExt::Show
