// Asks a reader everything that the shell asks of a file. The fuzzers do so with every input, the reliability
// tests with every damaged file.
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
  bool constructed = false;     // false if the constructor threw std::invalid_argument or std::length_error
  bool valid = false;           // whether the reader accepts the file
  int bitmaps = 0;              // the number of requests that returned a bitmap
  std::uint64_t bitmapSum = 0;  // the sum of all bytes of the bitmaps
  std::string wrong;            // what broke a rule that holds for every file; empty if nothing did
};

inline constexpr LONG kMaxRequest = std::numeric_limits<LONG>::max();
/// Requests of every kind: smaller and larger than a frame, one pixel, far from a frame's proportions, and
/// negative.
inline constexpr SIZE kAllRequests[] = {{1, 1},   {3, 2},   {5, 5},   {96, 96},
                                        {1, 256}, {-5, 40}, {-3, -2}, {kMaxRequest, kMaxRequest}};

/// Makes the reader of `extension` on `stream`. If the file is valid, asks for its metadata, then for
/// thumbnails of the sizes `requests`, then for its metadata again. Then reads the facts of the header
/// (HeaderFacts) and returns the answers.
Answers AskEverything(std::istream& stream, const std::wstring& extension,
                      std::span<const SIZE> requests = kAllRequests);

/// Returns whether a thumbnail of the frame can take seconds although the file is small, because its pixels
/// overlap. AskEverything requests no thumbnails of such frames. Returns false if the frame has so many
/// pixels that the reader refuses it at once.
bool TakesLong(Size2 frame);

/// Returns whether a request for a thumbnail ends the process by design: a request of 0 does, and so does one
/// that exceeds a colour frame in both dimensions. AskEverything leaves out such requests.
bool IsRequiredFault(Size2 frame, bool colour, const SIZE& request);

}  // namespace Qel::Lumetra::ShellExt::Testing
