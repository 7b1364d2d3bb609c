// Collects everything that the extension says about one file and judges it.
#pragma once

#include <cstdint>
#include <string>

#include "file_facts.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Collects the facts of the file at `path`, with a thumbnail for a square of `size` pixels. A file that ends
/// the worker process is judged by that, and the worker is ready for the next file.
FileFacts InspectFile(Worker& worker, const std::wstring& path, const std::wstring& name, std::int32_t size);

}  // namespace Qel::Lumetra::ShellExt::Show
