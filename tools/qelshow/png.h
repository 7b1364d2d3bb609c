// PNG files through the platform's imaging component (WIC).
#pragma once

#include <windows.h>

#include <cstdint>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// The file's bytes for a DIB section of 8-bit grey or 24-bit colour, whose rows lie from the top. COM must
/// be initialised. `bitmap` stays the caller's. On failure `png` is empty.
HRESULT EncodePng(HBITMAP bitmap, std::vector<std::uint8_t>& png);

}  // namespace Qel::Lumetra::ShellExt::Show
