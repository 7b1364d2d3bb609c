// Encodes PNG files with the imaging component of Windows (WIC).
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// Encodes a bitmap as a PNG file in `png`, with this program's name in its "Software" text. `bitmap` must be
/// a top-down DIB section of 8-bit grey or 24-bit colour pixels; the caller keeps it. COM must be
/// initialised. Returns a failure of the imaging component; then `png` is empty.
HRESULT EncodePng(HBITMAP bitmap, std::vector<std::uint8_t>& png);

/// Returns whether a file that begins with these bytes was made by EncodePng. kMarkedPngBytes bytes are
/// enough.
bool IsMarkedPng(std::string_view beginning);
inline constexpr std::size_t kMarkedPngBytes = 61;

}  // namespace Qel::Lumetra::ShellExt::Show
