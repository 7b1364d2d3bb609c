// Makes every single allocation of a call fail. The call must throw std::bad_alloc or return no thumbnail,
// and leak nothing. The object must work again as soon as there is memory.
#include <gtest/gtest.h>

#include <istream>
#include <memory>
#include <new>
#include <string>
#include <utility>

#include "allocation_meter.h"
#include "bitmap_pixels.h"
#include "file_kind_test.h"
#include "memory_buffer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::BitmapPixels;
using Testing::FailingHeap;
using Testing::SampleFile;

/// How a call ended: it returned or threw after an allocation failed, or it made too few allocations for one
/// to fail.
enum class Outcome { kAnswered, kThrew, kNotReached };

// How many calls for a thumbnail return, with or without a picture, although an allocation fails. All other
// failing allocations throw.
//
// On Windows all of them throw, because Windows itself takes no memory from this heap. Its POSIX stand-in
// makes four allocations for a grey bitmap and never throws: one for the device context, without which it
// still makes the bitmap, and three for the bitmap. So if only one allocation fails, one call returns the
// picture and three return no bitmap; if all later ones fail too, none of the four calls returns a bitmap.
//
// A colour bitmap has no colour table and takes only two. They come before the frame reader's buffer, whose
// allocation throws if all later ones fail too.
#ifdef _WIN32
constexpr int kPicturesWithoutDeviceContext = 0;
constexpr int kGreyAnswersWithoutBitmap = 0;
constexpr int kColourAnswersWithoutBitmap = 0;
#else
constexpr int kPicturesWithoutDeviceContext = 1;
constexpr int kGreyAnswersWithoutBitmap = 3 + 4;
constexpr int kColourAnswersWithoutBitmap = 2;
#endif

/// Calls `call` and makes the allocation with the index `allocation` fail.
template <class Call>
Outcome CallWithFailingHeap(std::int64_t allocation, FailingHeap::Then then, const Call& call) {
  const FailingHeap heap(allocation, then);
  try {
    call();
  } catch (const std::bad_alloc&) {
    return Outcome::kThrew;
  }
  return heap.Failed() ? Outcome::kAnswered : Outcome::kNotReached;
}

/// Calls `call` again and again. Its first allocation fails, then its second, and so on, until it has no
/// further one. Calls `check` after each call, to check and free what it returned. Returns how often the call
/// threw.
template <class Call, class Check>
int FailEveryAllocation(const Call& call, const Check& check) {
  int exceptions = 0;
  for (const auto then : {FailingHeap::Then::kRecovers, FailingHeap::Then::kKeepsFailing}) {
    Outcome outcome = Outcome::kAnswered;
    for (std::int64_t i = 0; outcome != Outcome::kNotReached; ++i) {
      SCOPED_TRACE("allocation " + std::to_string(i));
      const Testing::HeapUse before = Testing::CurrentHeapUse();
      outcome = CallWithFailingHeap(i, then, call);
      check(outcome);
      EXPECT_EQ(Testing::CurrentHeapUse(), before);
      if (outcome == Outcome::kThrew) ++exceptions;
    }
  }
  return exceptions;
}

class OutOfMemory : public Testing::FileKindTest {
 protected:
  /// Throws the first exception of this thread, for which the runtime allocates what it keeps for all later
  /// ones.
  static void SetUpTestSuite() { EXPECT_THROW(throw std::bad_alloc(), std::bad_alloc); }
};

TEST_P(OutOfMemory, WhileAReaderIsMadeLeaksNothing) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    Testing::MemoryBuffer buffer(sample.bytes);
    std::istream stream(&buffer);
    const int exceptions = FailEveryAllocation(
        [&] {
          stream.clear();
          stream.seekg(0);
          MakeReader(stream);
        },
        [](Outcome outcome) { EXPECT_NE(outcome, Outcome::kAnswered); });
    EXPECT_GT(exceptions, 0);
    stream.clear();
    stream.seekg(0);
    EXPECT_TRUE(MakeReader(stream)->IsValid());
  }
}

TEST_P(OutOfMemory, WhileAThumbnailIsMadeLeaksNothing) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    Testing::MemoryBuffer buffer(sample.bytes);
    std::istream stream(&buffer);
    const auto reader = MakeReader(stream);
    const BitmapPixels expected = Testing::TakeBitmap(reader->CreateThumbnail(Testing::kSmallRequest));
    HBITMAP bitmap = nullptr;
    int pictures = 0;
    int answersWithoutPicture = 0;
    const int exceptions = FailEveryAllocation(
        [&] { bitmap = reader->CreateThumbnail(Testing::kSmallRequest); },
        [&](Outcome outcome) {
          const BitmapPixels answer = Testing::TakeBitmap(std::exchange(bitmap, nullptr));
          if (outcome != Outcome::kThrew) ++(answer == expected ? pictures : answersWithoutPicture);
          EXPECT_TRUE(answer == expected || answer == BitmapPixels());
          EXPECT_TRUE(reader->IsValid());
          EXPECT_EQ(Testing::TakeBitmap(reader->CreateThumbnail(Testing::kSmallRequest)), expected);
        });
    EXPECT_GT(exceptions, 0);
    const bool isColour = reader->GetBitDepth() == 24;
    EXPECT_EQ(pictures, 2 + kPicturesWithoutDeviceContext);
    EXPECT_EQ(answersWithoutPicture, isColour ? kColourAnswersWithoutBitmap : kGreyAnswersWithoutBitmap);
  }
}

TEST_P(OutOfMemory, WhileStringsAreMadeLeaksNothing) {
  for (const SampleFile& sample : samples_) {
    SCOPED_TRACE(sample.name);
    Testing::MemoryBuffer buffer(sample.bytes);
    std::istream stream(&buffer);
    const auto reader = MakeReader(stream);
    const std::wstring name = reader->GetDataTypeName();
    const std::wstring comment = reader->GetComment();
    FailEveryAllocation(
        [&] {
          reader->GetTypeDescription();
          reader->GetDataTypeName();
          reader->GetComment();
        },
        [&](Outcome outcome) {
          EXPECT_NE(outcome, Outcome::kAnswered);
          EXPECT_EQ(reader->GetDataTypeName(), name);
          EXPECT_EQ(reader->GetComment(), comment);
        });
  }
}

INSTANTIATE_TEST_SUITE_P(All, OutOfMemory, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
