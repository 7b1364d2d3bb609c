// How much memory a large picture takes.
#include <gtest/gtest.h>

#include <istream>
#include <string>

#include "allocation_meter.h"
#include "bitmap_pixels.h"
#include "file_type_factory.h"
#include "memory_buffer.h"
#include "mrc_file.h"
#include "raw_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::int32_t kEdge = 4096;
constexpr std::int64_t kFrameBytes = std::int64_t{kEdge} * kEdge * 4;

/// The most memory in use while a thumbnail is made of a file that is `head` and a frame of zeros.
std::int64_t PeakOfThumbnail(const std::string& head, const std::wstring& extension) {
  Testing::MemoryBuffer buffer(head);
  buffer.zerosBehind = kFrameBytes;
  std::istream stream(&buffer);
  const Testing::HeapMeter meter;
  const auto reader = CreateFileTypeInfo(stream, extension);
  EXPECT_EQ(Testing::TakeBitmap(reader->CreateThumbnail({256, 256})).width, 256);
  EXPECT_EQ(buffer.bytesRead, static_cast<std::int64_t>(head.size()) + kFrameBytes);
  return meter.Peak();
}

TEST(LargeFrame, ThumbnailTakesMemoryForABandAndNotForTheFrame) {
  constexpr std::int64_t kMost = 4 << 20;
  EXPECT_LT(PeakOfThumbnail(Testing::MrcFile{.nx = kEdge, .ny = kEdge, .mode = 2}.Bytes(), L"mrc"), kMost);
  EXPECT_LT(PeakOfThumbnail(Testing::PackedRawFile(DataType::kInt32, kEdge, kEdge, "").Bytes(), L"raw"),
            kMost);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
