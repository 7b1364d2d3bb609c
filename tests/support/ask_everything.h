// Asks a reader all that the shell ever asks of a file, in one call: what the fuzzers do with every input and
// the reliability tests with every damaged file.
#pragma once

#include <windows.h>

#include <cstdint>
#include <istream>
#include <limits>
#include <span>
#include <string>

#include "size2.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct Answers {
  bool constructed = false;     // false after one of the exceptions that a constructor may end with
  bool valid = false;           // as first answered
  int bitmaps = 0;              // of the requests, how many were answered by a bitmap
  std::uint64_t bitmapSum = 0;  // of all their bytes
  std::string wrong;            // what no file may bring about; empty if all is well
};

/// Requests of every kind: smaller and larger than a frame, of one pixel, out of proportion and negative.
inline constexpr LONG kMaxRequest = std::numeric_limits<LONG>::max();
inline constexpr SIZE kAllRequests[] = {{1, 1},   {3, 2},   {5, 5},   {96, 96},
                                        {1, 256}, {-5, 40}, {-3, -2}, {kMaxRequest, kMaxRequest}};

/// Makes the reader of `extension` on `stream` and asks a valid one for its metadata, for thumbnails of
/// the sizes `requests` and for its metadata again.
Answers AskEverything(std::istream& stream, const std::wstring& extension,
                      std::span<const SIZE> requests = kAllRequests);

/// Whether asking for a thumbnail ends the process by design: a request of 0, and a colour frame that is
/// smaller than the request in both dimensions. Such requests are left out.
bool IsRequiredFault(Size2 frame, bool colour, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt::Testing
