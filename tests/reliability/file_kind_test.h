// What the tests that run once for each file kind have in common.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "file_type_factory.h"
#include "sample_files.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Its parameter is one of kSampleKinds.
class FileKindTest : public testing::TestWithParam<const char*> {
 protected:
  std::unique_ptr<FileTypeInfo> MakeReader(std::istream& stream) const {
    return CreateFileTypeInfo(stream, extension_);
  }

  const std::string kind_ = GetParam();
  const std::wstring extension_{kind_.begin(), kind_.end()};
  const std::vector<SampleFile> samples_ = SampleFiles(kind_);
};

inline const auto kEachFileKind = testing::ValuesIn(kSampleKinds);

/// The name of a test's instance for a kind.
inline std::string KindName(const testing::TestParamInfo<const char*>& kind) {
  return kind.param;
}

/// Small, and no larger than any sample, so that colour frames can be reduced to it as well.
inline constexpr SIZE kSmallRequest = {2, 2};

}  // namespace Qel::Lumetra::ShellExt::Testing
