// The operations to measure, which use an image file as the shell does: through the readers natively, and
// through the objects of the built DLL on Windows. ReadBlocks is the only baseline that differs between the
// systems.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Bench {

/// Opens the file, makes its thumbnail and closes it. The caller owns the bitmap, which is null on failure.
HBITMAP MakeThumbnail(const std::wstring& path, const SIZE& request);

/// Reads everything that the shell shows for a file, except the picture. `view` is "reader" (natively), or
/// "tip", "columns", "sets" or "store" (on Windows). Returns whether all values could be read.
bool ReadMetadata(const std::string& view, const std::wstring& path);

/// Blocks of the same size at equal distances in a file. Positions and sizes are in bytes.
struct Blocks {
  std::int64_t first = 0;
  std::int64_t distance = 0;
  std::int64_t count = 0;
  std::size_t bytes = 0;
};

/// Reads the blocks with as few system calls as possible. Returns false if the file does not contain all of
/// them.
bool ReadBlocks(const std::wstring& path, const Blocks& blocks);

}  // namespace Qel::Lumetra::ShellExt::Bench
