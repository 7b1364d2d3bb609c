// Parses the command line, and contains the help.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

enum class Command { kHelp, kInfo, kThumbnail, kPage, kDoctor };

struct CommandLine {
  Command command = Command::kHelp;
  std::wstring helpText;  // for kHelp: the help or the version
  std::vector<std::wstring> files;
  std::wstring server;  // if empty, the registered extension
  std::wstring out;     // a file or a folder
  std::int32_t size = 256;
  bool json = false;
};

/// Parses `arguments`, which do not include the program's name. Throws Failure with a sentence for the user
/// if they are invalid.
CommandLine ParseCommandLine(const std::vector<std::wstring>& arguments);

}  // namespace Qel::Lumetra::ShellExt::Show
