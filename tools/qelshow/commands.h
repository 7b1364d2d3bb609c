// The commands of the program. Each answers the program's exit status and throws Failure.
#pragma once

#include "command_line.h"

namespace Qel::Lumetra::ShellExt::Show {

int RunInfo(const CommandLine& line);
int RunThumbnail(const CommandLine& line);
int RunPage(const CommandLine& line);

}  // namespace Qel::Lumetra::ShellExt::Show
