// Files that lie: whatever a header says, there is an answer or a refusal, no fault, and no more memory than
// the limit. The sanitizers of the native build find what is read or written outside of its bounds.
#include <gtest/gtest.h>

#include <algorithm>
#include <istream>
#include <iterator>
#include <string>

#include "allocation_meter.h"
#include "ask_everything.h"
#include "file_kind_test.h"
#include "memory_buffer.h"
#include "random_values.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::SampleFile;

/// A lie in a header may cost this much more than the true file takes.
constexpr std::int64_t kMostBytesForALie = 16 << 20;

/// And a file of 100 bytes takes no more than this, whatever it says.
constexpr std::int64_t kMostBytesForAHundred = 1 << 20;

/// Two are enough for hundreds of thousands of files: a reduced picture, and one of every pixel.
constexpr SIZE kRequests[] = {{3, 2}, {Testing::kLargestRequest, Testing::kLargestRequest}};

constexpr std::uint32_t kBoundaries[] = {
    0,          1,          2,          0x7F,       0x80,       0xFF,       0x100,      0x7FFF,
    0x8000,     0xFFFF,     0x10000,    0x10001,    46341,      0x00FFFFFF, 0x01000000, 0x3FFFFFFF,
    0x40000000, 0x7FFFFFFE, 0x7FFFFFFF, 0x80000000, 0x80000001, 0xFFFFFC00, 0xFFFFFFFE, 0xFFFFFFFF};

void PutField(std::string& bytes, std::size_t offset, std::uint32_t value) {
  for (std::size_t i = 0; i < 4; ++i) bytes[offset + i] = static_cast<char>(value >> (8 * i));
}

class DamagedFile : public Testing::FileKindTest {
 protected:
  /// The most memory that the questions take.
  std::int64_t Ask(const std::string& bytes) {
    const Testing::HeapMeter meter;
    Testing::MemoryBuffer buffer(bytes);
    std::istream stream(&buffer);
    const auto answers = Testing::AskEverything(stream, extension_, kRequests);
    EXPECT_EQ(answers.wrong, "");
    return meter.Peak();
  }

  /// Asks about the sample as `damage` leaves it, which may take `most` bytes.
  template <class Damage>
  void AskDamaged(const SampleFile& sample, std::int64_t most, const Damage& damage) {
    std::string bytes = sample.bytes;
    damage(bytes);
    EXPECT_LE(Ask(bytes), most) << sample.name;
  }
};

TEST_P(DamagedFile, EveryByteOfEveryValue) {
  const SampleFile& sample = samples_.front();
  const std::int64_t most = Ask(sample.bytes) + kMostBytesForALie;
  for (std::size_t i = 0; i < sample.bytes.size(); ++i) {
    for (int value = 0; value < 256; ++value) {
      AskDamaged(sample, most, [&](std::string& bytes) { bytes[i] = static_cast<char>(value); });
    }
  }
}

TEST_P(DamagedFile, EveryFieldOfBoundaryValues) {
  constexpr std::size_t kHeaderBytes = 96;  // of all samples; of the first one all there is
  for (const SampleFile& sample : samples_) {
    const std::int64_t most = Ask(sample.bytes) + kMostBytesForALie;
    const std::size_t end = &sample == &samples_.front() ? sample.bytes.size() : kHeaderBytes;
    for (std::size_t i = 0; i + 4 <= std::min(end, sample.bytes.size()); ++i) {
      for (const std::uint32_t value : kBoundaries) {
        AskDamaged(sample, most, [&](std::string& bytes) {
          for (std::size_t byte = 0; byte < 4; ++byte)
            bytes[i + byte] = static_cast<char>(value >> (8 * byte));
        });
      }
    }
  }
}

TEST_P(DamagedFile, HundredBytesTakeAtMostAMebibyte) {
  // Sizes of which pictures become large when many pixels share their bytes.
  constexpr std::uint32_t kSizes[] = {0, 1, 2, 8, 255, 256, 257, 512, 1000, 1024, 65536};
  Testing::Random random(7);
  const auto pick = [&random](const auto& values) {
    return values[static_cast<std::size_t>(random.Between(0, static_cast<int>(std::size(values)) - 1))];
  };
  for (int i = 0; i < 20000; ++i) {
    std::string bytes = pick(samples_).bytes;
    bytes.resize(100);
    for (int lies = random.Between(1, 6); lies > 0; --lies) {
      const auto field = static_cast<std::size_t>(random.Between(0, 96));
      PutField(bytes, field, random.OneIn(2) ? pick(kSizes) : pick(kBoundaries));
    }
    EXPECT_LE(Ask(bytes), kMostBytesForAHundred);
  }
}

TEST_P(DamagedFile, EveryLength) {
  for (const SampleFile& sample : samples_) {
    const std::int64_t most = Ask(sample.bytes);
    for (std::size_t length = 0; length < sample.bytes.size(); ++length) {
      AskDamaged(sample, most, [&](std::string& bytes) { bytes.resize(length); });
    }
  }
}

/// Strides make pixels share their bytes, so that a few bytes are a picture of any size.
TEST(SharedPixels, HundredBytesTakeAtMostAMebibyte) {
  int thumbnails = 0;
  for (const DataType type : {DataType::kUInt8, DataType::kInt32, DataType::kFloat64,
                              DataType::kComplexFloat64, DataType::kRgb24}) {
    for (const std::int32_t width : {2, 100, 256, 300, 500, 1000, 1024, 100000}) {
      for (const std::int32_t height : {2, 100, 256, 300, 500, 1000, 1024, 100000}) {
        Testing::RawFile file = Testing::PackedRawFile(type, width, height, std::string(51, '\3'));
        file.pixelStride = 0;
        file.rowStride = 0;
        const std::string bytes = file.Bytes();
        const Testing::HeapMeter meter;
        Testing::MemoryBuffer buffer(bytes);
        std::istream stream(&buffer);
        const auto answers = Testing::AskEverything(stream, L"raw");
        EXPECT_LE(meter.Peak(), kMostBytesForAHundred) << width << " x " << height;
        thumbnails += answers.bitmaps;
      }
    }
  }
  EXPECT_GT(thumbnails, 0);
}

INSTANTIATE_TEST_SUITE_P(All, DamagedFile, Testing::kEachFileKind, Testing::KindName);

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
