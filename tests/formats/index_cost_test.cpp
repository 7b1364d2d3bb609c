// Counts what the readers of indexed files read and seek, at the stream's buffer.
#include <gtest/gtest.h>

#include <istream>
#include <sstream>
#include <string>
#include <utility>

#include "emi_file.h"
#include "image_file_info.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using namespace Testing;

class CountingBuffer : public std::stringbuf {
 public:
  explicit CountingBuffer(const std::string& bytes) : std::stringbuf(bytes, std::ios_base::in) {}

  std::int64_t seeks() const { return seeks_; }
  std::int64_t reads() const { return reads_; }
  std::int64_t bytes() const { return bytes_; }

 protected:
  std::streamsize xsgetn(char* bytes, std::streamsize count) override {
    const std::streamsize read = std::stringbuf::xsgetn(bytes, count);
    ++reads_;
    bytes_ += read;
    return read;
  }
  pos_type seekoff(off_type offset, std::ios_base::seekdir from, std::ios_base::openmode which) override {
    ++seeks_;
    return std::stringbuf::seekoff(offset, from, which);
  }
  pos_type seekpos(pos_type position, std::ios_base::openmode which) override {
    ++seeks_;
    return std::stringbuf::seekpos(position, which);
  }

 private:
  std::int64_t seeks_ = 0;
  std::int64_t reads_ = 0;
  std::int64_t bytes_ = 0;
};

TEST(SerCost, ElementHeaderTakesOneSeekAndOneRead) {
  constexpr std::int64_t kElements = 100000;
  SerFile file;
  file.elements.resize(kElements);
  CountingBuffer buffer(file.Bytes());
  std::istream stream(&buffer);
  const SerFileInfo ser(stream);
  ASSERT_TRUE(ser.IsValid());
  EXPECT_EQ(ser.GetFrameCount(), kElements);
  // The rest is the fixed header, and one seek and one read for every thousand offsets.
  EXPECT_LE(buffer.seeks(), kElements + kElements / 1000 + 1);
  EXPECT_LE(buffer.reads(), kElements + kElements / 1000 + 20);
  EXPECT_LE(buffer.bytes(), kElements * (50 + 4) + 100);
}

TEST(SerCost, FalseNumbersCostNoMoreThanTheFileHolds) {
  SerFile honest;
  honest.elements.resize(100);
  SerFile elements = honest;
  elements.totalElements = elements.validElements = 0xFFFFFFFF;
  SerFile dimensions = honest;
  dimensions.dimensionCount = 0xFFFFFFFF;
  SerFile text = honest;
  text.dimensions[0].descriptionLength = 0x7FFFFFFF;
  for (const SerFile& file : {elements, dimensions, text}) {
    const std::string bytes = file.Bytes();
    CountingBuffer buffer(bytes);
    std::istream stream(&buffer);
    EXPECT_FALSE(SerFileInfo(stream).IsValid());
    EXPECT_LE(buffer.bytes(), static_cast<std::int64_t>(bytes.size()));
    EXPECT_LE(buffer.seeks() + buffer.reads(), static_cast<std::int64_t>(bytes.size() / 4));
  }
}

/// Traverses a tree and expects that no byte is read twice, except the widths and heights of pixel arrays.
void ExpectOnePass(const std::string& items, std::int64_t images) {
  const std::string bytes = EmiFile{.items = items}.Bytes();
  CountingBuffer buffer(bytes);
  std::istream stream(&buffer);
  const EmiFileInfo emi(stream);
  EXPECT_EQ(emi.GetFrameCount(), images);
  EXPECT_LE(buffer.bytes(), static_cast<std::int64_t>(bytes.size()) + 8 * images);
  EXPECT_LE(buffer.seeks() + buffer.reads(), static_cast<std::int64_t>(bytes.size()) + 3 * images);
}

TEST(EmiCost, TreeIsTraversedInOnePass) {
  constexpr std::int64_t kMany = 50000;
  std::string openings;
  std::string ends;
  std::string images;
  std::string arrays;
  for (std::int64_t i = 0; i < kMany; ++i) {
    openings += EmiOpening(0x4000, 1);
    ends += EmiEnd();
    images += EmiImageObject(EmiPixelArray(0x2202, 1, 1, "x"));
    arrays += EmiArray(0x2060, 1, "x");
  }
  ExpectOnePass(openings, 0);
  ExpectOnePass(openings + ends, 0);
  ExpectOnePass(images, kMany);
  ExpectOnePass(openings + arrays + images, kMany);
}

TEST(EmiCost, OnlyTheFirstLineIsLookedAt) {
  const std::string array = EmiArray(0x2102, 0x0202, BytesOf<std::uint32_t>({100}) + std::string(1000, 'x'));
  const auto cost = [](const std::string& items) {
    const std::string bytes = EmiFile{.items = items}.Bytes();
    CountingBuffer buffer(bytes);
    std::istream stream(&buffer);
    const EmiFileInfo emi(stream);
    return std::pair(buffer.bytes(), buffer.seeks() + buffer.reads());
  };
  const auto [plainBytes, plainCalls] =
      cost(EmiStructure(0x4000, 1, EmiArray(0x2060, 1, std::string(1004, 'x'))));
  const auto [firstBytes, firstCalls] = cost(EmiLineDataObject(array));
  const auto [manyBytes, manyCalls] = cost(EmiLineDataObject(array) + EmiLineDataObject(array));
  EXPECT_EQ(firstBytes, plainBytes + 4);
  EXPECT_EQ(firstCalls, plainCalls + 3);
  EXPECT_LE(manyBytes, 2 * plainBytes + 4);
  EXPECT_LE(manyCalls, 2 * plainCalls + 3);
}

TEST(Cost, LongStringsAreReadOnlyUpToTheLimit) {
  SerFile ser;
  ser.elements.resize(1);
  ser.dimensions[0].units = std::string(1000000, 'u');
  CountingBuffer serBuffer(ser.Bytes());
  std::istream serStream(&serBuffer);
  EXPECT_TRUE(SerFileInfo(serStream).IsValid());
  EXPECT_LE(serBuffer.bytes(), 512 + 200);

  const std::string label = EmiText(0x0100, std::string(1000000, 'x'));
  CountingBuffer emiBuffer(EmiFile{.items = EmiImageObject(label)}.Bytes());
  std::istream emiStream(&emiBuffer);
  EXPECT_TRUE(EmiFileInfo(emiStream).IsValid());
  EXPECT_LE(emiBuffer.bytes(), 512 + 100);
}

TEST(EmiCost, LongValuesAreNotRead) {
  const std::string longText = EmiStructure(0x4000, 1, EmiText(1, std::string(1000000, 'x')));
  const std::string longArray = EmiArray(0x2060, 1, std::string(1000000, 'x'));
  const std::string bytes = EmiFile{.items = longText + longArray + EmiImageObject("")}.Bytes();
  CountingBuffer buffer(bytes);
  std::istream stream(&buffer);
  EXPECT_TRUE(EmiFileInfo(stream).IsValid());
  EXPECT_LE(buffer.bytes(), 1000);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
