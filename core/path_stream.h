// Opens the file at a path as a standard stream.
#pragma once

#include <fstream>

namespace Qel::Lumetra::ShellExt {

/// Opens `stream` on the file at `path` for binary reading. Other programs may continue to read, write,
/// rename and delete the file, because the microscope may still be recording it. On success the stream's
/// state is cleared. On failure, which includes a stream that is already open, failbit is set.
void OpenPath(std::ifstream& stream, const wchar_t* path);

}  // namespace Qel::Lumetra::ShellExt
