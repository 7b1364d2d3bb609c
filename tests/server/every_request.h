// Sends the server every request that a shell can make for one file, and frees the answers.
#pragma once

#include <filesystem>

#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Sends every request to every class for the file at `path`, except those that end the process: `path` must
/// not be a colour frame smaller than 8 by 8 pixels. Other tests check the answers. Returns the number of
/// exceptions that left a request; they are caught.
int MakeEveryRequest(const ServerDll& dll, const std::filesystem::path& path);

}  // namespace Qel::Lumetra::ShellExt::Testing
