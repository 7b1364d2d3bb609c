// Checks that the samples from which the reliability tests and the fuzzers start are valid.
#include <gtest/gtest.h>

#include <istream>
#include <set>

#include "ask_everything.h"
#include "file_kind_test.h"
#include "memory_buffer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::SampleFile;

class SampleFilesOfKind : public Testing::FileKindTest {};

TEST_P(SampleFilesOfKind, AreAtLeastTwentyAndDistinct) {
  std::set<std::string> names;
  std::set<std::string> contents;
  for (const SampleFile& sample : samples_) {
    names.insert(sample.name);
    contents.insert(sample.bytes);
  }
  EXPECT_EQ(names.size(), samples_.size());
  EXPECT_EQ(contents.size(), names.size());
  EXPECT_GE(contents.size(), 20u);
}

TEST_P(SampleFilesOfKind, AreValidAndGiveTheSameThumbnailsTwice) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    std::uint64_t sums[2] = {};
    for (std::uint64_t& sum : sums) {
      Testing::MemoryBuffer buffer(sample.bytes);
      std::istream stream(&buffer);
      const auto answers = Testing::AskEverything(stream, extension_);
      EXPECT_TRUE(answers.valid);
      EXPECT_GE(answers.bitmaps, 2);
      EXPECT_EQ(answers.wrong, "");
      sum = answers.bitmapSum;
    }
    EXPECT_EQ(sums[0], sums[1]);
  }
}

INSTANTIATE_TEST_SUITE_P(All, SampleFilesOfKind, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
