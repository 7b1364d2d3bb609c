// Turns a frame of a file into a thumbnail, for every file kind.
#pragma once

#include <windows.h>

#include <istream>

#include "frame_layout.h"

namespace Qel::Lumetra::ShellExt {

/// Reads one frame and renders it (frame_renderer.h). Returns the bitmap, owned by the caller. Memory does
/// not depend on the size of the frame, which is read in bands, in the order of the file if the layout allows
/// it, or else in tiles.
///
/// Returns null for a frame without pixels or of an unknown pixel type, for a layout that places a pixel
/// outside of its block or would take too long (more than 2^26 pixels that share their bytes, or pixels too
/// scattered), and when the stream does not hold the whole block or fails; a short stream is left
/// failed, as by a short read.
HBITMAP ReadThumbnail(std::istream& stream, const FrameLayout& layout, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
