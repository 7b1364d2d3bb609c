// Where a command writes. A file of another origin is never replaced, and a file of this program only by a
// complete new one.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

#include "handle_owner.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Throws Failure with kExitUsage if a PNG file at `path` would replace anything but a PNG file of this
/// program, or would be the file `input` itself, or has the extension of a kind that the extension shows.
void CheckPictureOutput(const std::wstring& path, const std::wstring& input);

/// Throws Failure with kExitUsage if a page of `files` files in this folder would replace anything but a page
/// of this program and its pictures.
void CheckPageOutput(const std::wstring& folder, std::size_t files);

/// Whether a page may replace this file in its folder of pictures, or remove it.
bool IsPictureOfPage(const std::wstring& path);

/// Throws Failure that says why the system does not write at `path`. `error` is a code of the system or of
/// the standard library.
[[noreturn]] void CannotWrite(const std::wstring& path, DWORD error);
[[noreturn]] void CannotWrite(const std::wstring& path, const std::error_code& error);

/// Creates a file that must not exist yet; throws Failure otherwise.
Com::OwnedHandle CreateNewFile(const std::wstring& path);
void WriteNewFile(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

/// Moves a file to the place of another one, or where none is. Throws Failure.
void MoveInto(const std::wstring& path, const std::wstring& place);

/// Writes a file beside `path` and moves it there. Throws Failure, with what was at `path` unchanged.
void ReplaceFileAt(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

}  // namespace Qel::Lumetra::ShellExt::Show
