// The doctor: reports whether the extension works, and why the shell does not show what it should.
#pragma once

#include "command_line.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Prints how the extension is installed on this computer, whether it can read the files of the command line,
/// and what to do about every problem. Returns the highest verdict of the files, but at least kExitFailed if
/// the installation does not work, if the kind of a file is not registered, or if Windows does not show what
/// the extension returns for a file.
int RunDoctor(const CommandLine& line);

}  // namespace Qel::Lumetra::ShellExt::Show
