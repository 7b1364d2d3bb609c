// Why a file has no picture and what its header says, found with the project's own readers.
#pragma once

#include <string>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Opens and parses the file at `path`, once for each. The sentence names what is wrong, as far as the
/// readers can tell.
Diagnosis Diagnose(const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
