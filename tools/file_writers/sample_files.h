// Small, valid and varied files of every kind, which cover every pixel type, byte order, form of strides and
// version. They are the seeds of the fuzzers, and the files that the reliability tests damage.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "sample_kinds.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct SampleFile {
  std::string name;  // valid as a file name
  std::string bytes;
};

/// Returns at least 20 files of `kind`, one of kSampleKinds. All of them have a thumbnail. The first is the
/// smallest with all parts of its kind. Throws std::invalid_argument for an unknown kind.
std::vector<SampleFile> SampleFiles(std::string_view kind);

}  // namespace Qel::Lumetra::ShellExt::Testing
