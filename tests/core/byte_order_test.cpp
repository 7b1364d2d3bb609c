#include "byte_order.h"

#include <gtest/gtest.h>

#include <istream>
#include <limits>
#include <sstream>
#include <string>

#include "memory_buffer.h"
#include "read_text.h"
#include "skip_bytes.h"
#include "wrap.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr unsigned char kBytes[] = {0x81, 0x82, 0x83, 0x84, 0x85, 0x86, 0x87, 0x88, 0x89};

TEST(LoadLittleEndian, TakesTheLowByteFirst) {
  EXPECT_EQ(LoadLittleEndian<std::uint8_t>(kBytes), 0x81u);
  EXPECT_EQ(LoadLittleEndian<std::uint16_t>(kBytes), 0x8281u);
  EXPECT_EQ(LoadLittleEndian<std::uint32_t>(kBytes), 0x84838281u);
  EXPECT_EQ(LoadLittleEndian<std::uint64_t>(kBytes), 0x8887868584838281u);
}

TEST(LoadLittleEndian, KeepsTheSign) {
  EXPECT_EQ(LoadLittleEndian<std::int8_t>(kBytes), -0x7F);
  EXPECT_EQ(LoadLittleEndian<std::int16_t>(kBytes), static_cast<std::int16_t>(0x8281));
  EXPECT_EQ(LoadLittleEndian<std::int32_t>(kBytes), static_cast<std::int32_t>(0x84838281));
}

TEST(LoadLittleEndian, NeedsNoAlignment) {
  EXPECT_EQ(LoadLittleEndian<std::uint64_t>(kBytes + 1), 0x8988878685848382u);
}

TEST(LoadLittleEndian, DecodesFloatsAndDoubles) {
  constexpr unsigned char kFloat[] = {0x00, 0x00, 0x20, 0xC0};
  EXPECT_EQ(LoadLittleEndian<float>(kFloat), -2.5f);
  constexpr unsigned char kDouble[] = {0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x04, 0xC0};
  EXPECT_EQ(LoadLittleEndian<double>(kDouble), -2.5);
}

TEST(ReadLittleEndian, ReadsOneNumberAfterTheOther) {
  std::istringstream stream("\1\2\3\4\5\6\7");
  EXPECT_EQ(ReadLittleEndian<std::uint16_t>(stream), 0x0201u);
  EXPECT_EQ(ReadLittleEndian<std::uint32_t>(stream), 0x06050403u);
  EXPECT_TRUE(stream.good());
}

TEST(ReadLittleEndian, FailsTheStreamWhenBytesAreMissing) {
  std::istringstream stream("\1\2\3");
  EXPECT_EQ(ReadLittleEndian<std::uint32_t>(stream), 0x030201u);
  EXPECT_TRUE(stream.fail());
  EXPECT_EQ(ReadLittleEndian<std::uint32_t>(stream), 0u);
}

TEST(SkipBytes, SkipsAnyNumberOfBytesThatTheStreamHolds) {
  for (const std::uint32_t count : {0u, 1u, 511u, 512u, 513u, 99998u}) {
    std::istringstream stream('a' + std::string(count, 'x') + 'z');
    stream.get();
    SkipBytes(stream, count);
    EXPECT_TRUE(stream.good());
    EXPECT_EQ(stream.get(), 'z') << count;
  }
}

TEST(SkipBytes, FailsTheStreamAtItsEnd) {
  for (const std::uint32_t length : {0u, 1u, 511u, 512u, 513u, 99998u}) {
    for (const std::uint32_t count : {length, length + 1, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
      std::istringstream stream(std::string(length, 'x'));
      SkipBytes(stream, count);
      EXPECT_EQ(stream.good(), count == length) << count << " of " << length;
    }
  }
}

TEST(SkipBytes, FailsWhenTheLastByteIsMissing) {
  // Unlike a string stream, a file can be positioned after its end.
  const std::string bytes(1000, 'x');
  for (const std::uint32_t count : {512u, 513u, 999u, 1000u, 1001u, 1002u, 5000u}) {
    Testing::MemoryBuffer buffer(bytes);
    std::istream stream(&buffer);
    SkipBytes(stream, count);
    EXPECT_EQ(stream.good(), count <= 1000) << count;
    EXPECT_LE(buffer.bytesRead, 512);
  }
}

TEST(ReadText, ReturnsTheFirst512BytesAndSkipsTheRest) {
  for (const std::uint32_t length : {0u, 1u, 511u, 512u, 513u, 1024u, 1025u, 99998u}) {
    const std::string text = std::string(length / 2, 'x') + std::string(length - length / 2, 'y');
    std::istringstream stream('a' + text + 'z');
    stream.get();
    EXPECT_EQ(ReadText(stream, length), text.substr(0, 512)) << length;
    EXPECT_TRUE(stream.good());
    EXPECT_EQ(stream.get(), 'z') << length;
  }
}

TEST(ReadText, FailsTheStreamAtItsEnd) {
  for (const std::uint32_t length : {0u, 1u, 511u, 512u, 513u, 99998u}) {
    for (const std::uint32_t claimed : {length, length + 1, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
      std::istringstream stream(std::string(length, 'x'));
      EXPECT_LE(ReadText(stream, claimed).size(), length);
      EXPECT_EQ(stream.good(), claimed == length) << claimed << " of " << length;
    }
  }
}

TEST(WrapToInt32, KeepsTheLow32Bits) {
  using Limits = std::numeric_limits<std::int32_t>;
  EXPECT_EQ(WrapToInt32(std::int64_t{Limits::max()}), Limits::max());
  EXPECT_EQ(WrapToInt32(std::int64_t{Limits::max()} + 1), Limits::min());
  EXPECT_EQ(WrapToInt32(std::int64_t{Limits::min()} - 1), Limits::max());
  EXPECT_EQ(WrapToInt32(std::int64_t{1} << 32), 0);
  EXPECT_EQ(WrapToInt32(std::uint64_t{0xFFFFFFFF}), -1);
}

TEST(WrappingProduct, IsTheProductModulo2To32) {
  using Limits = std::numeric_limits<std::int32_t>;
  EXPECT_EQ(WrappingProduct(-3, 4), -12);
  EXPECT_EQ(WrappingProduct(0x10000, 0x10000), 0);
  EXPECT_EQ(WrappingProduct(0x10000, 0x8000), Limits::min());
  EXPECT_EQ(WrappingProduct(Limits::min(), Limits::min()), 0);
  EXPECT_EQ(WrappingProduct(Limits::max(), Limits::max()), 1);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
