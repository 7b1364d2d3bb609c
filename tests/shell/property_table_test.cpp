#include "property_table.h"

#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <fstream>
#include <iterator>
#include <limits>
#include <stdexcept>
#include <string>

#include "info_tip.h"
#include "shell_values.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// A reader that returns any values, including some that no file kind has.
class FakeReader final : public FileTypeInfo {
 public:
  Size2 size{512, 256};
  std::int32_t frames = 61;

  bool IsValid() const override { return true; }
  std::wstring GetTypeDescription() const override { return L"description"; }
  Size2 GetDimensions() const override { return size; }
  std::int32_t GetFrameCount() const override { return frames; }
  std::int32_t GetBitDepth() const override { return 16; }
  std::wstring GetDataTypeName() const override { return L"16 bit signed"; }
  std::wstring GetComment() const override { return L"comment"; }
  HBITMAP CreateThumbnail(const SIZE&) const override { throw std::logic_error("no test asks for pixels"); }
};

TEST(PropertyTable, GivesTheSameInAllViewsExceptDimensionsAndComment) {
  const FakeReader reader;
  const struct {
    PROPERTYKEY key;
    Metadatum value;
    Metadatum storeValue;
  } rows[] = {
      {kWidthKey, 512, 512},
      {kHeightKey, 256, 256},
      {kBitDepthKey, 16, 16},
      {kFrameCountKey, 61, 61},
      {kDimensionsKey, L"512 x 256", L"(512 x 256) 16 bit signed"},
      {kCommentsKey, L"comment", L"description"},
  };
  ASSERT_EQ(kProperties.size(), std::size(rows));
  for (std::size_t i = 0; i < kProperties.size(); ++i) {
    const auto& [key, value, storeValue] = rows[i];
    EXPECT_EQ(FindProperty(key), &kProperties[i]);
    EXPECT_EQ(kProperties[i].value(reader), value) << key.pid;
    EXPECT_EQ(kProperties[i].storeValue(reader), storeValue) << key.pid;
  }
}

TEST(PropertyTable, FindsAPropertyByItsSetAndItsId) {
  for (const Property& property : kProperties) EXPECT_EQ(FindProperty(property.key), &property);
  for (PROPID id = 0; id < 40; ++id) {
    const bool isImage = id == 3 || id == 4 || id == 7 || id == 12 || id == 13;
    EXPECT_EQ(FindProperty({kImageSummary, id}) != nullptr, isImage) << id;
    EXPECT_EQ(FindProperty({kSummary, id}) != nullptr, id == 6) << id;
    EXPECT_EQ(FindProperty({kOtherSet, id}), nullptr) << id;
  }
}

TEST(PropertyTable, NamesThePropertiesOfTheRegisteredList) {
  std::string list = "prop:";
  for (const Property& property : kProperties) {
    if (&property != kProperties.data()) list += ';';
    const std::wstring name = property.canonicalName;
    list.append(name.begin(), name.end());
  }
  std::ifstream script("mrc.rgs", std::ios::binary);
  const std::string text{std::istreambuf_iterator(script), {}};
  for (const char* view : {"FullDetails", "InfoTip", "PreviewDetails", "PreviewTitle"}) {
    EXPECT_NE(text.find(std::string("val '") + view + "' = s '" + list + "'"), std::string::npos) << view;
  }
}

TEST(PropertyTable, WritesNegativeNumbersUnchanged) {
  FakeReader reader;
  reader.size = {-2, std::numeric_limits<std::int32_t>::min()};
  EXPECT_EQ(FindProperty(kWidthKey)->value(reader), Metadatum(-2));
  EXPECT_EQ(FindProperty(kDimensionsKey)->value(reader), Metadatum(L"-2 x -2147483648"));
}

/// Returns the first line of the tip of a file that does not exist.
std::wstring FirstLine(const FileTypeInfo& reader) {
  wchar_t* tip = nullptr;
  EXPECT_EQ(MakeInfoTip(reader, L"Z:\\no such file", &tip), S_OK);
  const std::wstring line = tip != nullptr ? tip : L"";
  CoTaskMemFree(tip);
  return line.substr(0, line.find(L'\r'));
}

TEST(InfoTip, CountsFramesFromTwoOn) {
  FakeReader reader;
  EXPECT_EQ(FirstLine(reader), L"Dimensions: 61 images (512 \u00D7 256) 16 bit signed");
  for (const std::int32_t frames : {1, 0, -1, std::numeric_limits<std::int32_t>::min()}) {
    reader.frames = frames;
    EXPECT_EQ(FirstLine(reader), L"Dimensions: (512 \u00D7 256) 16 bit signed") << frames;
  }
  reader.frames = 2;
  EXPECT_EQ(FirstLine(reader), L"Dimensions: 2 images (512 \u00D7 256) 16 bit signed");
  reader.frames = std::numeric_limits<std::int32_t>::max();
  EXPECT_EQ(FirstLine(reader), L"Dimensions: 2147483647 images (512 \u00D7 256) 16 bit signed");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
