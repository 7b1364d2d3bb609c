// What is measured: how the shell uses an image file. Natively these are the readers, on Windows the objects
// of the built DLL. And the one baseline that differs between the systems.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Bench {

/// Opens the file, makes its thumbnail and closes it. The caller owns the bitmap, which is null on failure.
HBITMAP MakeThumbnail(const std::wstring& path, const SIZE& request);

/// Requests everything that the shell shows of a file except the picture: as "reader" (natively), or as
/// "tip", "columns", "sets" or "store" (on Windows). Returns whether there were answers.
bool ReadMetadata(const std::string& view, const std::wstring& path);

/// Blocks of one size at equal distances in a file. Offsets in bytes.
struct Blocks {
  std::int64_t first = 0;
  std::int64_t distance = 0;
  std::int64_t count = 0;
  std::size_t bytes = 0;
};

/// Reads the blocks with the fewest system calls; returns false when the file does not have them all.
bool ReadBlocks(const std::wstring& path, const Blocks& blocks);

}  // namespace Qel::Lumetra::ShellExt::Bench
