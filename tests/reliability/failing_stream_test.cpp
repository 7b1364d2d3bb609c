// Streams that fail: at every single read, in every way, and those that cannot be positioned.
#include <gtest/gtest.h>

#include <istream>
#include <memory>
#include <string>

#include "allocation_meter.h"
#include "ask_everything.h"
#include "bitmap_pixels.h"
#include "file_kind_test.h"
#include "memory_buffer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BitmapPixels;
using Testing::MemoryBuffer;
using Testing::SampleFile;
using Failure = MemoryBuffer::Failure;

/// A file, its reader and what it reads.
struct OpenSample {
  OpenSample(const SampleFile& sample, const std::wstring& extension, std::int64_t failingRead,
             Failure failure)
      : buffer(sample.bytes) {
    buffer.failingRead = failingRead;
    buffer.failure = failure;
    reader = CreateFileTypeInfo(stream, extension);
  }

  BitmapPixels Thumbnail() const {
    return Testing::TakeBitmap(reader->CreateThumbnail(Testing::kSmallRequest));
  }

  MemoryBuffer buffer;
  std::istream stream{&buffer};
  std::unique_ptr<FileTypeInfo> reader;
};

class FailingStream : public Testing::FileKindTest {
 protected:
  /// Lets read `failingRead` of the sample fail and looks at what comes of it.
  void Fail(const SampleFile& sample, const OpenSample& whole, std::int64_t readsOfHeader,
            std::int64_t failingRead, Failure failure) {
    OpenSample open(sample, extension_, failingRead, failure);
    if (failingRead < readsOfHeader) {
      // An item tree that ends early keeps the images that it has shown so far.
      EXPECT_TRUE(!open.reader->IsValid() || kind_ == "emi");
      if (open.reader->IsValid()) open.Thumbnail();
      return;
    }
    ASSERT_TRUE(open.reader->IsValid());
    EXPECT_EQ(open.Thumbnail(), BitmapPixels());
    EXPECT_TRUE(open.stream.fail());
    EXPECT_EQ(open.reader->GetDimensions(), whole.reader->GetDimensions());
    EXPECT_EQ(open.Thumbnail(), BitmapPixels()) << "from a stream that is left failed";
    open.stream.clear();
    EXPECT_EQ(open.Thumbnail(), whole.Thumbnail());
  }
};

TEST_P(FailingStream, AtEveryReadIsRefusedOrGivesNoThumbnailAndIsOverAfterIt) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    const OpenSample whole(sample, extension_, -1, Failure::kBringsNothing);
    const std::int64_t readsOfHeader = whole.buffer.reads;
    ASSERT_NE(whole.Thumbnail(), BitmapPixels());
    const std::int64_t reads = whole.buffer.reads;
    for (std::int64_t i = 0; i < reads; ++i) {
      for (const Failure failure : {Failure::kBringsNothing, Failure::kBringsHalf, Failure::kThrows}) {
        SCOPED_TRACE("read " + std::to_string(i));
        const Testing::HeapUse before = Testing::CurrentHeapUse();
        Fail(sample, whole, readsOfHeader, i, failure);
        EXPECT_EQ(Testing::CurrentHeapUse(), before);
      }
    }
  }
}

TEST_P(FailingStream, ThatCannotBePositionedIsNoFault) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    MemoryBuffer buffer(sample.bytes);
    buffer.seekable = false;
    std::istream stream(&buffer);
    const auto answers = Testing::AskEverything(stream, extension_);
    EXPECT_EQ(answers.wrong, "");
    EXPECT_EQ(answers.bitmaps, 0);
  }
}

INSTANTIATE_TEST_SUITE_P(All, FailingStream, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
