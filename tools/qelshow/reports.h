// Formats the facts about a file as text, and as a row of a table. json_records.h formats them as JSON.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Returns all facts about a file except its problem, as lines of text.
std::wstring TextReport(const FileFacts& facts);

/// Return rows of the table of files. `nameWidth` is the width of the first column in characters.
std::wstring TableHeading(std::size_t nameWidth);
std::wstring TableRow(const FileFacts& facts, std::size_t nameWidth);

}  // namespace Qel::Lumetra::ShellExt::Show
