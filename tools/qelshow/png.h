// PNG files through the platform's imaging component (WIC).
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// The file's bytes for a DIB section of 8-bit grey or 24-bit colour, whose rows lie from the top. COM must
/// be initialised. `bitmap` stays the caller's. On failure `png` is empty. The file names this program as the
/// software that made it.
HRESULT EncodePng(HBITMAP bitmap, std::vector<std::uint8_t>& png);

/// Whether a file that begins with these bytes was made by EncodePng; kMarkedPngBytes are enough.
bool IsMarkedPng(std::string_view beginning);
inline constexpr std::size_t kMarkedPngBytes = 61;

}  // namespace Qel::Lumetra::ShellExt::Show
