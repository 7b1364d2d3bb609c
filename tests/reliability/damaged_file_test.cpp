// Tests files with damaged contents. Whatever a header says, the reader must answer or reject the file,
// without crashing and without exceeding the memory limit. The sanitizers of the native build find
// out-of-bounds accesses.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <istream>
#include <iterator>
#include <optional>
#include <string>

#include "allocation_meter.h"
#include "ask_everything.h"
#include "bitmap_pixels.h"
#include "damage.h"
#include "file_kind_test.h"
#include "file_type_factory.h"
#include "memory_buffer.h"
#include "random_values.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::kBoundaryValues;
using Testing::PutField;
using Testing::SampleFile;

/// How much more memory, in bytes, a file may take than the same file without its damage.
constexpr std::int64_t kMaxBytesForDamage = 1 << 20;

/// The most memory, in bytes, that a file of 100 bytes may take.
constexpr std::int64_t kMaxBytesForAHundred = 1 << 20;

/// Requests a reduced picture, and one that has every pixel. More requests would take too long with hundreds
/// of thousands of files.
constexpr SIZE kRequests[] = {{3, 2}, {Testing::kMaxRequest, Testing::kMaxRequest}};

class DamagedFile : public Testing::FileKindTest {
 protected:
  ~DamagedFile() override {
    std::printf("%s: %d files take at most %lld bytes of memory", kind_.c_str(), files_,
                static_cast<long long>(most_));
    if (mostBeyond_) std::printf(", %lld more than the intact file", static_cast<long long>(*mostBeyond_));
    std::printf("\n");
  }

  /// Returns the most memory in use while all questions are asked, in bytes.
  std::int64_t Ask(const std::string& bytes) {
    const Testing::HeapMeter meter;
    Testing::MemoryBuffer buffer(bytes);
    std::istream stream(&buffer);
    const auto answers = Testing::AskEverything(stream, extension_, kRequests);
    EXPECT_EQ(answers.wrong, "");
    const std::int64_t peak = meter.Peak();
    ++files_;
    most_ = std::max(most_, peak);
    return peak;
  }

  /// Asks about the sample after `damage`. It may take `beyond` more bytes of memory than `whole`, which the
  /// intact sample takes.
  template <class Damage>
  void AskDamaged(const SampleFile& sample, std::int64_t whole, std::int64_t beyond, const Damage& damage) {
    std::string bytes = sample.bytes;
    damage(bytes);
    const std::int64_t more = Ask(bytes) - whole;
    EXPECT_LE(more, beyond) << sample.name;
    mostBeyond_ = std::max(mostBeyond_.value_or(0), more);
  }

 private:
  int files_ = 0;
  std::int64_t most_ = 0;
  std::optional<std::int64_t> mostBeyond_;
};

TEST_P(DamagedFile, EveryValueOfEveryByte) {
  const SampleFile& sample = samples_.front();
  const std::int64_t whole = Ask(sample.bytes);
  for (std::size_t i = 0; i < sample.bytes.size(); ++i) {
    for (int value = 0; value < 256; ++value) {
      AskDamaged(sample, whole, kMaxBytesForDamage,
                 [&](std::string& bytes) { bytes[i] = static_cast<char>(value); });
    }
  }
}

TEST_P(DamagedFile, BoundaryValuesInEveryField) {
  constexpr std::size_t kHeaderBytes = 96;  // of each sample except the first, which is damaged as a whole
  for (const SampleFile& sample : samples_) {
    const std::int64_t whole = Ask(sample.bytes);
    const std::size_t end = &sample == &samples_.front() ? sample.bytes.size() : kHeaderBytes;
    for (std::size_t i = 0; i + 4 <= std::min(end, sample.bytes.size()); ++i) {
      for (const std::uint32_t value : kBoundaryValues) {
        AskDamaged(sample, whole, kMaxBytesForDamage, [&](std::string& bytes) { PutField(bytes, i, value); });
      }
    }
  }
}

TEST_P(DamagedFile, HundredBytesTakeAtMostAMebibyte) {
  // Sizes that give large pictures when many pixels overlap.
  constexpr std::uint32_t kSizes[] = {0, 1, 2, 8, 255, 256, 257, 512, 1000, 1024, 65536};
  Testing::Random random(7);
  const auto pick = [&random](const auto& values) {
    return values[static_cast<std::size_t>(random.Between(0, static_cast<int>(std::size(values)) - 1))];
  };
  for (int i = 0; i < 20000; ++i) {
    std::string bytes = pick(samples_).bytes;
    bytes.resize(100);
    for (int fields = random.Between(1, 6); fields > 0; --fields) {
      const auto field = static_cast<std::size_t>(random.Between(0, 96));
      PutField(bytes, field, random.OneIn(2) ? pick(kSizes) : pick(kBoundaryValues));
    }
    EXPECT_LE(Ask(bytes), kMaxBytesForAHundred);
  }
}

TEST_P(DamagedFile, EveryLength) {
  for (const SampleFile& sample : samples_) {
    const std::int64_t whole = Ask(sample.bytes);
    for (std::size_t length = 0; length < sample.bytes.size(); ++length) {
      AskDamaged(sample, whole, 0, [&](std::string& bytes) { bytes.resize(length); });
    }
  }
}

/// The strides of a RAW file can make pixels overlap, so a few bytes can hold a picture of any size. The
/// memory must depend only on the request nevertheless.
TEST(SharedPixels, HundredBytesTakeAtMostAMebibyte) {
  constexpr SIZE kRequest = {96, 96};
  int thumbnails = 0;
  std::int64_t most = 0;
  for (const DataType type : {DataType::kUInt8, DataType::kInt32, DataType::kFloat64,
                              DataType::kComplexFloat64, DataType::kRgb24}) {
    for (const std::int32_t width : {100, 191, 1000, 8192}) {
      for (const std::int32_t height : {100, 191, 1000, 8192}) {
        Testing::RawFile file = Testing::PackedRawFile(type, width, height, std::string(51, '\3'));
        file.pixelStride = 0;
        file.rowStride = 0;
        const std::string bytes = file.Bytes();
        const Testing::HeapMeter meter;
        Testing::MemoryBuffer buffer(bytes);
        std::istream stream(&buffer);
        const HBITMAP bitmap = CreateFileTypeInfo(stream, L"raw")->CreateThumbnail(kRequest);
        EXPECT_LE(meter.Peak(), kMaxBytesForAHundred) << width << " x " << height;
        most = std::max(most, meter.Peak());
        if (Testing::TakeBitmap(bitmap).width > 0) ++thumbnails;
      }
    }
  }
  EXPECT_EQ(thumbnails, 5 * 4 * 4);
  std::printf("raw: %d pictures of overlapping pixels take at most %lld bytes of memory\n", thumbnails,
              static_cast<long long>(most));
}

INSTANTIATE_TEST_SUITE_P(All, DamagedFile, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
