// Writes a command's output files. It never replaces a file that another program has written, and replaces a
// file of this program only with a complete new one.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

#include "handle_owner.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Throws Failure with kExitUsage if a PNG file at `path` would replace anything except a PNG file of this
/// program, if `path` is the file `input` itself, or if it has the file-name extension of a supported kind.
void CheckPngOutput(const std::wstring& path, const std::wstring& input);

/// Throws Failure with kExitUsage if a page of `files` files in this folder would replace anything except a
/// page of this program and its thumbnails.
void CheckPageOutput(const std::wstring& folder, std::size_t files);

/// Returns whether a page may replace or remove this file in its folder of thumbnails.
bool IsThumbnailOfPage(const std::wstring& path);

/// Throws Failure with the reason why `path` cannot be written. `error` is a code of the system or of the
/// standard library.
[[noreturn]] void CannotWrite(const std::wstring& path, DWORD error);
[[noreturn]] void CannotWrite(const std::wstring& path, const std::error_code& error);

/// Create a file. Throw Failure if this fails or the file exists already.
Com::OwnedHandle CreateNewFile(const std::wstring& path);
void WriteNewFile(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

/// Moves a file to the path `to` and replaces the file there, if any. Throws Failure if that fails.
void MoveFileTo(const std::wstring& from, const std::wstring& to);

/// Writes a file next to `path`, then moves it to `path`. If that fails, throws Failure and leaves the file
/// at `path` unchanged.
void ReplaceFileAt(const std::wstring& path, const std::vector<std::uint8_t>& bytes);

}  // namespace Qel::Lumetra::ShellExt::Show
