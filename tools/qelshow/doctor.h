// The doctor: says why the shell does not show what it should.
#pragma once

#include "command_line.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Prints how the extension is installed on this computer, whether it reads the files that the line names,
/// and what to do about everything that is wrong. Answers the highest of the files' verdicts and, for an
/// installation that does not work or has left the kind of a file out, and for a file that Windows does not
/// show as the extension does, kExitFailed.
int RunDoctor(const CommandLine& line);

}  // namespace Qel::Lumetra::ShellExt::Show
