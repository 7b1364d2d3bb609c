// The doctor: reports why the shell does not show what it should.
#pragma once

#include "command_line.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Prints how the extension is installed on this computer, whether it reads the files of the command line,
/// and what to do about every problem. Returns the highest verdict of the files, but at least kExitFailed if
/// the installation does not work, if it does not include the kind of a file, or if Windows does not show a
/// file as the extension does.
int RunDoctor(const CommandLine& line);

}  // namespace Qel::Lumetra::ShellExt::Show
