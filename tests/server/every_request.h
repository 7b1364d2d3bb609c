// Everything that a shell can ask the server for one file, with the answers taken and given back.
#pragma once

#include <filesystem>

#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Sends every request of every class for the file at `path`, except those that end the process: `path` must
/// not be a colour frame smaller than 8 by 8 pixels. What the answers say is for other tests. An exception
/// that a request lets out is caught; returns how many there were.
int MakeEveryRequest(const ServerDll& dll, const std::filesystem::path& path);

}  // namespace Qel::Lumetra::ShellExt::Testing
