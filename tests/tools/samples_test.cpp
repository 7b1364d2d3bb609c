// Tests the bytes of the sample files, and how the readers read them. Runs in every build.
#include "samples.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <set>
#include <sstream>
#include <stdexcept>
#include <string>

#include "bitmap_pixels.h"
#include "file_kinds.h"
#include "file_type_factory.h"

namespace Qel::Lumetra::ShellExt::Samples {
namespace {

/// Continues the FNV-1a hash `hash` with `bytes`. It changes with every single bit.
std::uint64_t Hash(const std::string& bytes, std::uint64_t hash) {
  for (const char byte : bytes) hash = (hash ^ static_cast<unsigned char>(byte)) * 0x100000001B3u;
  return hash;
}

std::uint64_t HashOfAll() {
  std::uint64_t hash = 0xCBF29CE484222325u;
  for (const Sample& sample : AllSamples()) hash = Hash(sample.make(), Hash(sample.name, hash));
  return hash;
}

std::wstring ExtensionOf(const Sample& sample) {
  const std::string name = sample.name;
  return GetExtension({name.begin(), name.end()});
}

bool IsNamed(const Sample& sample, const char* beginning) {
  return std::string(sample.name).starts_with(beginning);
}

// This test runs in every build, so the number must be the same with every compiler and on every system.
TEST(Samples, HaveTheSameBytesInEveryRunAndOnEveryMachine) {
  EXPECT_EQ(HashOfAll(), 0x258CCA683ABB8A2Fu);
}

TEST(Samples, AreSmall) {
  std::size_t bytes = 0;
  for (const Sample& sample : AllSamples()) bytes += sample.make().size();
  EXPECT_LT(bytes, 10'000'000u);
}

TEST(Samples, HaveDistinctNames) {
  std::set<std::string> names;
  for (const Sample& sample : AllSamples()) EXPECT_TRUE(names.insert(sample.name).second) << sample.name;
}

TEST(Samples, CoverEveryKindAndEveryPixelType) {
  std::set<std::wstring> kinds;
  std::set<std::wstring> types;
  for (const Sample& sample : AllSamples()) {
    if (IsNamed(sample, "damaged")) continue;
    std::istringstream stream(sample.make());
    const auto reader = CreateFileTypeInfo(stream, ExtensionOf(sample));
    ASSERT_NE(reader, nullptr) << sample.name;
    ASSERT_TRUE(reader->IsValid()) << sample.name;
    kinds.insert(ExtensionOf(sample));
    types.insert(reader->GetDataTypeName());
  }
  EXPECT_EQ(kinds, std::set<std::wstring>(kExtensions.begin(), kExtensions.end()));
  EXPECT_EQ(types,
            (std::set<std::wstring>{L"8 bit unsigned", L"16 bit unsigned", L"32 bit unsigned",
                                    L"8 bit signed", L"16 bit signed", L"32 bit signed", L"32 bit float",
                                    L"64 bit float", L"32 bit complex integer", L"64 bit complex float",
                                    L"128 bit complex float", L"24 bit RGB", L"24 bit BGR"}));
}

TEST(Samples, HaveAThumbnailWithContrastUnlessTheyAreDamagedOrTruncated) {
  for (const Sample& sample : AllSamples()) {
    if (IsNamed(sample, "damaged")) continue;
    std::istringstream stream(sample.make());
    const auto reader = CreateFileTypeInfo(stream, ExtensionOf(sample));
    const auto pixels = Testing::TakeBitmap(reader->CreateThumbnail({128, 128}));
    if (IsNamed(sample, "truncated")) {
      EXPECT_EQ(pixels.width, 0) << sample.name;
    } else {
      EXPECT_GT(std::set<std::uint8_t>(pixels.bytes.begin(), pixels.bytes.end()).size(), 40u) << sample.name;
    }
  }
}

TEST(Samples, AreNotAcceptedIfTheyAreDamaged) {
  for (const Sample& sample : AllSamples()) {
    if (!IsNamed(sample, "damaged")) continue;
    std::istringstream stream(sample.make());
    try {
      EXPECT_FALSE(CreateFileTypeInfo(stream, ExtensionOf(sample))->IsValid()) << sample.name;
    } catch (const std::invalid_argument&) {
      EXPECT_EQ(ExtensionOf(sample), L"emi");
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Samples
