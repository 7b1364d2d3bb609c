// Finds out why a file has no thumbnail and what its header says, with the project's own readers.
#pragma once

#include <string>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Opens the file at `path` and returns its fault and the facts of its header, as far as the readers can
/// determine them. It parses the file once for each.
Diagnosis Diagnose(const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
