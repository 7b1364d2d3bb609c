// The facts of a file as text for a reader and as a row of a table. As JSON they are written by
// json_records.h.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Everything about a file that was read, as lines, but for its problem.
std::wstring TextReport(const FileFacts& facts);

/// Rows of a table of which every file is one; `nameWidth` is the number of characters of the first column.
std::wstring TableHeading(std::size_t nameWidth);
std::wstring TableRow(const FileFacts& facts, std::size_t nameWidth);

}  // namespace Qel::Lumetra::ShellExt::Show
