// The commands of the program. Each returns the program's exit status, or throws Failure.
#pragma once

#include "command_line.h"

namespace Qel::Lumetra::ShellExt::Show {

int RunInfo(const CommandLine& line);
int RunThumbnail(const CommandLine& line);
int RunPage(const CommandLine& line);

}  // namespace Qel::Lumetra::ShellExt::Show
