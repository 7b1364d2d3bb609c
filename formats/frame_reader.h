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
/// Returns null for a frame without pixels or of an unknown pixel type. Returns null and leaves the stream
/// failed, as a short read does, for a layout that places a pixel outside its block or would take too long
/// (too many pixels that share bytes, or too scattered ones), and when the stream has not the whole block or
/// fails.
HBITMAP ReadThumbnail(std::istream& stream, const FrameLayout& layout, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt
