// The byte source of a file named by its path.
#pragma once

#include <fstream>

namespace Qel::Lumetra::ShellExt {

/// Opens `stream` on the file at `path` for binary reading. Other programs may go on to read, write, rename
/// and delete the file, because a micrograph that is looked at may still be recorded.
/// On success the stream's state is cleared; on failure, also when `stream` is open already, failbit is set.
void OpenPath(std::ifstream& stream, const wchar_t* path);

}  // namespace Qel::Lumetra::ShellExt
