// Texts: the module's string table, and comments that files carry as bytes.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace Qel::Lumetra::ShellExt {

/// Returns a text of the module's string table, cut at 255 characters; empty for an id that is not in the
/// table. The ids that this code uses are in string_ids.h.
std::wstring LoadResourceString(std::uint32_t id);

/// Widens byte by byte with sign extension to 16 bits: 0x00..0x7F stay, 0x80..0xFF become U+FF80..U+FFFF.
/// No code page is applied, because a file does not say which one its writer had.
std::wstring WidenComment(std::string_view bytes);

}  // namespace Qel::Lumetra::ShellExt
