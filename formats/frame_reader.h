// Turns a frame of a file into a thumbnail, for every file kind.
#pragma once

#include <windows.h>

#include <istream>

#include "frame_layout.h"

namespace Qel::Lumetra::ShellExt {

/// Returns whether all pixels of the layout are inside the frame's block of bytes, and there are not too many
/// of them for the size of the block.
bool IsReadable(const FrameLayout& layout);

/// Reads one frame and renders it (frame_renderer.h). Returns the bitmap, which the caller owns. Memory does
/// not depend on the size of the frame, which is read in bands, in file order if the layout allows it, or
/// else in tiles.
///
/// Returns null for a frame without pixels or of an unknown pixel type. Returns null and leaves the stream
/// failed, as after a short read, for a layout that is not readable or whose pixels are too scattered, and if
/// the stream fails or does not contain the whole block.
HBITMAP ReadThumbnail(std::istream& stream, const FrameLayout& layout, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
