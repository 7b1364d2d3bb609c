// String helpers: conversions to and from UTF-8, the text of codes and identifiers, and tables.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

std::string Utf8(std::wstring_view text);

/// Converts from UTF-8. Invalid bytes become U+FFFD.
std::wstring Wide(std::string_view utf8);

/// Converts a string of a file, up to its first zero byte, from UTF-8 if it is valid, and from code page 1252
/// otherwise.
std::wstring TextOfFile(std::string_view bytes);

std::wstring Lowered(std::wstring_view text);

/// Returns for instance "0x80004005".
std::wstring HexCode(std::uint32_t code);

/// Returns this program's or the system's text for an HRESULT, without a full stop.
std::wstring ResultText(HRESULT result);

/// Returns the system's text for a code of GetLastError, without a full stop.
std::wstring SystemErrorText(DWORD error);

/// Returns the text for an error of the standard library, which has its own numbers for some errors.
std::wstring SystemErrorText(const std::error_code& error);

/// Returns the exit code of a crashed process, with its meaning if it is a known fault.
std::wstring ProcessEndText(DWORD exitCode);

/// Returns for instance "{6444048F-4C8B-11D1-8B70-080036B11A03}".
std::wstring GuidText(const GUID& guid);

/// Returns a class identifier in the form of GuidText; `text` itself if it is not an identifier.
std::wstring SpelledGuid(const std::wstring& text);

/// Returns the absolute form of a path.
std::wstring AbsolutePath(const std::wstring& path);

/// Returns the path of this program.
std::wstring OwnPath();

/// Returns `text`, padded with spaces at its end to at least `width` characters.
std::wstring Padded(std::wstring_view text, std::size_t width);

/// Returns a table of indented lines. Each column has the width of its widest cell.
std::wstring Grid(const std::vector<std::vector<std::wstring>>& rows);

}  // namespace Qel::Lumetra::ShellExt::Show
