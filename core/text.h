// The module's string table, and the comments that files contain as bytes.
#pragma once

#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt {

/// Returns a string of the module's string table, truncated to 255 characters; empty for an identifier that
/// is not in the table. string_ids.h lists the identifiers that this code uses.
std::wstring LoadResourceString(std::uint32_t id);

/// Widens each byte from `first` up to, but not including, `last` with sign extension to 16 bits: 0x00..0x7F
/// keep their values, 0x80..0xFF become U+FF80..U+FFFF. No code page is applied, because a file does not say
/// which code page its writer used.
std::wstring WidenComment(const char* first, const char* last);

}  // namespace Qel::Lumetra::ShellExt
