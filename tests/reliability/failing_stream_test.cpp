// Tests streams that fail, at every single read and in every way, and streams that cannot be positioned.
#include <gtest/gtest.h>

#include <istream>
#include <memory>
#include <string>

#include "allocation_meter.h"
#include "ask_everything.h"
#include "bitmap_pixels.h"
#include "file_kind_test.h"
#include "memory_buffer.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BitmapPixels;
using Testing::MemoryBuffer;
using Testing::SampleFile;
using Failure = MemoryBuffer::Failure;

/// A file, its reader and the buffer that counts its reads.
struct OpenSample {
  OpenSample(const SampleFile& sample, const std::wstring& extension, std::int64_t failingRead,
             Failure failure)
      : buffer(sample.bytes) {
    buffer.failingRead = failingRead;
    buffer.failure = failure;
    reader = CreateFileTypeInfo(stream, extension);
  }

  BitmapPixels Thumbnail(const SIZE& request = Testing::kSmallRequest) const {
    return Testing::TakeBitmap(reader->CreateThumbnail(request));
  }

  MemoryBuffer buffer;
  std::istream stream{&buffer};
  std::unique_ptr<FileTypeInfo> reader;
};

class FailingStream : public Testing::FileKindTest {
 protected:
  /// Makes the read `failingRead` of the sample fail and checks the reader.
  void Fail(const SampleFile& sample, const OpenSample& whole, std::int64_t readsOfHeader,
            std::int64_t failingRead, Failure failure) {
    OpenSample open(sample, extension_, failingRead, failure);
    if (failingRead < readsOfHeader) {
      // If the tree of an EMI file ends early, the images before its end count.
      EXPECT_TRUE(!open.reader->IsValid() || kind_ == "emi");
      if (open.reader->IsValid()) open.Thumbnail();
      return;
    }
    ASSERT_TRUE(open.reader->IsValid());
    EXPECT_EQ(open.Thumbnail(), BitmapPixels());
    EXPECT_TRUE(open.stream.fail());
    EXPECT_EQ(open.reader->GetDimensions(), whole.reader->GetDimensions());
    EXPECT_EQ(open.Thumbnail(), BitmapPixels()) << "although the stream has failed before";
    open.stream.clear();
    EXPECT_EQ(open.Thumbnail(), whole.Thumbnail());
  }
};

TEST_P(FailingStream, AtAnyReadIsRefusedOrGivesNoThumbnailAndRecovers) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    const OpenSample whole(sample, extension_, -1, Failure::kReturnsNothing);
    const std::int64_t readsOfHeader = whole.buffer.reads;
    ASSERT_NE(whole.Thumbnail(), BitmapPixels());
    const std::int64_t reads = whole.buffer.reads;
    for (std::int64_t i = 0; i < reads; ++i) {
      for (const Failure failure : {Failure::kReturnsNothing, Failure::kReturnsHalf, Failure::kThrows}) {
        SCOPED_TRACE("read " + std::to_string(i));
        const Testing::HeapUse before = Testing::CurrentHeapUse();
        Fail(sample, whole, readsOfHeader, i, failure);
        EXPECT_EQ(Testing::CurrentHeapUse(), before);
      }
    }
  }
}

TEST_P(FailingStream, ThatCannotBePositionedCausesNoFault) {
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

/// Frames that do not fit into the reader's buffer: one of several bands, one whose rows are larger than the
/// buffer, and one that is stored column by column.
TEST(FailingStreamOfALargeFrame, AtAnyReadGivesNoThumbnailAndRecovers) {
  struct Shape {
    std::int32_t width, height, pixelStride, rowStride;
    SIZE request;
  };
  constexpr Shape kShapes[] = {
      {700, 900, 1, 700, {2, 2}}, {300'000, 8, 1, 300'000, {75'000, 4}}, {100, 6000, 6000, 1, {10, 600}}};
  for (const Shape& shape : kShapes) {
    SCOPED_TRACE(std::to_string(shape.width) + " x " + std::to_string(shape.height));
    auto file = Testing::PackedRawFile(DataType::kUInt8, shape.width, shape.height, "");
    file.pixelStride = shape.pixelStride;
    file.rowStride = shape.rowStride;
    file.pixels.assign(static_cast<std::size_t>(shape.width) * static_cast<std::size_t>(shape.height), 'p');
    const SampleFile sample{"large", file.Bytes()};
    const OpenSample whole(sample, L"raw", -1, Failure::kReturnsNothing);
    const std::int64_t readsOfHeader = whole.buffer.reads;
    const BitmapPixels picture = whole.Thumbnail(shape.request);
    ASSERT_NE(picture, BitmapPixels());
    const std::int64_t reads = whole.buffer.reads;
    EXPECT_GT(reads, readsOfHeader + 2);
    for (std::int64_t i = readsOfHeader; i < reads; ++i) {
      OpenSample open(sample, L"raw", i, Failure::kReturnsHalf);
      EXPECT_EQ(open.Thumbnail(shape.request), BitmapPixels()) << i;
      EXPECT_TRUE(open.stream.fail());
      open.stream.clear();
      EXPECT_EQ(open.Thumbnail(shape.request), picture) << i;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(All, FailingStream, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
