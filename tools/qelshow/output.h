// Writes a command's output files. A file that another program has written is never replaced, and a file of
// this program only by a complete new one.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

#include "handle_owner.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Throws Failure with kExitUsage if a PNG file at `path` would replace anything except a PNG file of this
/// program, if it would be the file `input` itself, or if it has the extension of a supported file kind.
void CheckPictureOutput(const std::wstring& path, const std::wstring& input);

/// Throws Failure with kExitUsage if a page of `files` files in this folder would replace anything except a
/// page of this program and its pictures.
void CheckPageOutput(const std::wstring& folder, std::size_t files);

/// Returns whether a page may replace or remove this file in its folder of pictures.
bool IsPictureOfPage(const std::wstring& path);

/// Throws Failure with the reason why `path` cannot be written. `error` is a code of the system or of the
/// standard library.
[[noreturn]] void CannotWrite(const std::wstring& path, DWORD error);
[[noreturn]] void CannotWrite(const std::wstring& path, const std::error_code& error);

/// Creates a file that must not exist yet. Throws Failure otherwise.
Com::OwnedHandle CreateNewFile(const std::wstring& path);
void WriteNewFile(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

/// Moves a file to `place` and replaces the file there, if any. Throws Failure.
void MoveInto(const std::wstring& path, const std::wstring& place);

/// Writes a file next to `path`, then moves it to `path`. Throws Failure; then the file at `path` is
/// unchanged.
void ReplaceFileAt(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

}  // namespace Qel::Lumetra::ShellExt::Show
