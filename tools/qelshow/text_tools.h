// Small texts: conversions to and from UTF-8, the way in which codes and identifiers are written, tables.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

std::string Utf8(std::wstring_view text);

/// Bytes that are not UTF-8 become U+FFFD.
std::wstring Wide(std::string_view utf8);

/// A text of a file, as far as its first zero byte: UTF-8, or else the code page of western Windows.
std::wstring TextOfFile(std::string_view bytes);

std::wstring Lowered(std::wstring_view text);

/// For instance 0x80004005.
std::wstring HexCode(std::uint32_t code);

/// What this program or the system says about an HRESULT, without a full stop.
std::wstring ResultText(HRESULT result);

/// What the system says about an error code of GetLastError, without a full stop.
std::wstring SystemErrorText(DWORD error);

/// The same of an error of the standard library, which has numbers of its own for some.
std::wstring SystemErrorText(const std::error_code& error);

/// The code with which a process ended, and its meaning where it is a known fault.
std::wstring ProcessEndText(DWORD exitCode);

/// For instance {6444048F-4C8B-11D1-8B70-080036B11A03}.
std::wstring GuidText(const GUID& guid);

/// A class identifier in the spelling of GuidText; the text itself if it is none.
std::wstring SpelledGuid(const std::wstring& text);

/// The full path of what `path` names.
std::wstring AbsolutePath(const std::wstring& path);

/// The path of this program.
std::wstring OwnPath();

/// `text` with blanks behind it, at least `width` characters in all.
std::wstring Padded(std::wstring_view text, std::size_t width);

/// Rows of cells in columns as wide as their widest cell, each line indented.
std::wstring Grid(const std::vector<std::vector<std::wstring>>& rows);

}  // namespace Qel::Lumetra::ShellExt::Show
