// The ways in which the facts of a file are written: as JSON, as text for a reader, as a row of a table.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The version of the JSON that JsonReport writes. It changes when a member is renamed, removed or given
/// another meaning; a new member does not change it.
inline constexpr int kJsonSchema = 1;

/// `picture` is where the thumbnail was written, relative to the document; empty if nowhere.
std::string JsonReport(const FileFacts& facts, std::wstring_view picture);

/// Everything about the file, as lines.
std::wstring TextReport(const FileFacts& facts);

/// Rows of a table of which every file is one; `nameWidth` is the number of characters of the first column.
std::wstring TableHeading(std::size_t nameWidth);
std::wstring TableRow(const FileFacts& facts, std::size_t nameWidth);

}  // namespace Qel::Lumetra::ShellExt::Show
