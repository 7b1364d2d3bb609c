// Finds out why a file has no picture and what its header says, with the project's own readers.
#pragma once

#include <string>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Opens and parses the file at `path`, once for its fault and once for the facts of its header. Returns
/// both, as far as the readers can determine them.
Diagnosis Diagnose(const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
