#include "metadata.h"

#include <gtest/gtest.h>
#include <windows.h>

#include <limits>
#include <stdexcept>
#include <string>

#include "shell_values.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// A file that answers whatever a test wants, also what no file kind does.
class FakeFile final : public FileTypeInfo {
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
  HBITMAP CreateThumbnail(const SIZE&) const override { throw std::logic_error("nobody asked for pixels"); }
};

const PROPERTYKEY kResolutionXKey{kImageSummary, 5};
const PROPERTYKEY kResolutionYKey{kImageSummary, 6};

/// What a view answers, as the shell would get it; the type VT_EMPTY for nothing.
Value Answer(View view, const FileTypeInfo& file, const PROPERTYKEY& key) {
  const auto found = FindMetadatum(view, file, key);
  if (!found) return {};
  if (view == View::kColumn) {
    VARIANT value{};
    EXPECT_EQ(ToColumnValue(*found, value), S_OK);
    return TakeValue(value);
  }
  PROPVARIANT value{};
  EXPECT_EQ(
      view == View::kPropertySet ? ToPropertySetValue(*found, value) : ToPropertyStoreValue(*found, value),
      S_OK);
  return TakeValue(value);
}

TEST(Metadata, DiffersBetweenTheViewsAsItAlwaysHas) {
  const FakeFile file;
  const struct {
    PROPERTYKEY key;
    Value column, set, store;
  } rows[] = {
      {kWidthKey, Number(VT_I4, 512), Number(VT_INT, 512), Number(VT_UI4, 512)},
      {kHeightKey, Number(VT_I4, 256), Number(VT_INT, 256), Number(VT_UI4, 256)},
      {kResolutionXKey, Number(VT_I4, 512), {}, {}},
      {kResolutionYKey, Number(VT_I4, 256), {}, {}},
      {kBitDepthKey, Number(VT_I4, 16), Number(VT_INT, 16), Number(VT_UI4, 16)},
      {kFrameCountKey, Number(VT_I4, 61), Number(VT_INT, 61), Number(VT_UI4, 61)},
      {kDimensionsKey, Text(VT_BSTR, L"512 x 256"), Text(VT_BSTR, L"512 x 256"),
       Text(VT_LPWSTR, L"(512 x 256) 16 bit signed")},
      {kCommentsKey, Text(VT_BSTR, L"comment"), Text(VT_BSTR, L"comment"), Text(VT_LPWSTR, L"description")},
  };
  for (const auto& [key, column, set, store] : rows) {
    EXPECT_EQ(Answer(View::kColumn, file, key), column) << key.pid;
    EXPECT_EQ(Answer(View::kPropertySet, file, key), set) << key.pid;
    EXPECT_EQ(Answer(View::kPropertyStore, file, key), store) << key.pid;
  }
  EXPECT_EQ(TipDimensions(file), L"61 images (512 \u00D7 256) 16 bit signed");
}

TEST(Metadata, KeepsTheIdsOfTheTwoSetsApart) {
  const FakeFile file;
  for (const View view : {View::kColumn, View::kPropertySet, View::kPropertyStore}) {
    for (DWORD id = 0; id < 40; ++id) {
      const bool isImage = id == 3 || id == 4 || id == 7 || id == 12 || id == 13 ||
                           (view == View::kColumn && (id == 5 || id == 6));
      EXPECT_EQ(FindMetadatum(view, file, {kImageSummary, id}).has_value(), isImage) << id;
      EXPECT_EQ(FindMetadatum(view, file, {kSummary, id}).has_value(), id == 6) << id;
      EXPECT_FALSE(FindMetadatum(view, file, {kOtherSet, id}).has_value()) << id;
    }
  }
}

TEST(Metadata, TipCountsFramesFromTwoOn) {
  FakeFile file;
  for (const std::int32_t frames : {1, 0, -1, std::numeric_limits<std::int32_t>::min()}) {
    file.frames = frames;
    EXPECT_EQ(TipDimensions(file), L"(512 \u00D7 256) 16 bit signed") << frames;
  }
  file.frames = 2;
  EXPECT_EQ(TipDimensions(file), L"2 images (512 \u00D7 256) 16 bit signed");
  file.frames = std::numeric_limits<std::int32_t>::max();
  EXPECT_EQ(TipDimensions(file), L"2147483647 images (512 \u00D7 256) 16 bit signed");
}

TEST(Metadata, ShowsNegativeNumbersAsEachTypeDoes) {
  FakeFile file;
  file.size = {-2, std::numeric_limits<std::int32_t>::min()};
  EXPECT_EQ(Answer(View::kColumn, file, kWidthKey), Number(VT_I4, -2));
  EXPECT_EQ(Answer(View::kPropertySet, file, kWidthKey), Number(VT_INT, -2));
  EXPECT_EQ(Answer(View::kPropertyStore, file, kWidthKey), Number(VT_UI4, 0xFFFFFFFE));
  EXPECT_EQ(Answer(View::kColumn, file, kDimensionsKey), Text(VT_BSTR, L"-2 x -2147483648"));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
