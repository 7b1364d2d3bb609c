// The base of tests that run once for each file kind.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "file_type_factory.h"
#include "sample_files.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// A test of one file kind. The parameter is one of kSampleKinds.
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

/// Returns the name of a test's instance for a kind.
inline std::string KindName(const testing::TestParamInfo<const char*>& kind) {
  return kind.param;
}

/// Not larger than any sample, because a colour frame must not be smaller than the request.
inline constexpr SIZE kSmallRequest = {2, 2};

}  // namespace Qel::Lumetra::ShellExt::Testing
