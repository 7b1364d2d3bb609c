// Collects all answers of the extension about one file, with a verdict on the file.
#pragma once

#include <cstdint>
#include <string>

#include "file_facts.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Returns the facts about the file at `path`, with a thumbnail for a request of `size` by `size` pixels. If
/// a request about the file crashes the worker process, the facts say so, and the worker is ready for the
/// next file.
FileFacts InspectFile(Worker& worker, const std::wstring& path, const std::wstring& name, std::int32_t size);

}  // namespace Qel::Lumetra::ShellExt::Show
