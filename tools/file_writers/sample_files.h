// Valid files of every kind, small and different from each other: every pixel type, byte order, stride form
// and version. They are the seeds of the fuzzers and what the reliability tests damage.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "sample_kinds.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct SampleFile {
  std::string name;  // of characters that a file name can have
  std::string bytes;
};

/// At least 20 files of `kind`, one of kSampleKinds. Every one of them has a thumbnail; the first is the
/// smallest that has all parts of its kind.
std::vector<SampleFile> SampleFiles(std::string_view kind);

}  // namespace Qel::Lumetra::ShellExt::Testing
