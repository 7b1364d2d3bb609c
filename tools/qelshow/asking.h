// All questions about one file, and the judgement of the answers.
#pragma once

#include <cstdint>
#include <string>

#include "file_facts.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Asks everything about the file at `path`; the thumbnail is asked for a square of `size` pixels. A file
/// that ends the worker process is judged by that and leaves the worker ready for the next one.
FileFacts AskFile(Worker& worker, const std::wstring& path, const std::wstring& name, std::int32_t size);

}  // namespace Qel::Lumetra::ShellExt::Show
