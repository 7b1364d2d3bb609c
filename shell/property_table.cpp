#include "property_table.h"

#include <shlobj.h>

#include <algorithm>

#include "string_ids.h"

namespace Qel::Lumetra::ShellExt {
namespace {

Metadatum Width(const FileTypeInfo& reader) {
  return reader.GetDimensions().width;
}

Metadatum Height(const FileTypeInfo& reader) {
  return reader.GetDimensions().height;
}

Metadatum BitDepth(const FileTypeInfo& reader) {
  return reader.GetBitDepth();
}

Metadatum FrameCount(const FileTypeInfo& reader) {
  return reader.GetFrameCount();
}

std::wstring DimensionsText(const FileTypeInfo& reader) {
  const Size2 size = reader.GetDimensions();
  return std::to_wstring(size.width) + L" x " + std::to_wstring(size.height);
}

/// Returns, for instance, "4096 x 4096", in the form that the shell itself uses for dimensions, so that the
/// column sorts and reads as it does for other images.
Metadatum Dimensions(const FileTypeInfo& reader) {
  return DimensionsText(reader);
}

/// Returns, for instance, "(4096 x 4096) 16 bit signed", because a property store has no separate property
/// for the pixel type.
Metadatum TypedDimensions(const FileTypeInfo& reader) {
  return L"(" + DimensionsText(reader) + L") " + reader.GetDataTypeName();
}

Metadatum Comment(const FileTypeInfo& reader) {
  return reader.GetComment();
}

/// Replaces the comment in a property store, which has no separate property for the file kind.
Metadatum TypeDescription(const FileTypeInfo& reader) {
  return reader.GetTypeDescription();
}

constexpr DWORD kText = SHCOLSTATE_TYPE_STR;
constexpr DWORD kHiddenText = SHCOLSTATE_TYPE_STR | SHCOLSTATE_HIDDEN;
constexpr DWORD kShownText = SHCOLSTATE_TYPE_STR | SHCOLSTATE_ONBYDEFAULT;

}  // namespace

constinit const std::array<Property, 6> kProperties{{
    {.key = {kImageSummarySet, kWidthId},
     .canonicalName = L"System.Image.HorizontalSize",
     .plainName = L"Width",
     .title = IDS_WIDTH,
     .declaredType = VT_I4,
     .width = 5,
     .state = kHiddenText,
     .value = Width,
     .storeValue = Width},
    {.key = {kImageSummarySet, kHeightId},
     .canonicalName = L"System.Image.VerticalSize",
     .plainName = L"Height",
     .title = IDS_HEIGHT,
     .declaredType = VT_I4,
     .width = 5,
     .state = kHiddenText,
     .value = Height,
     .storeValue = Height},
    {.key = {kImageSummarySet, 7},
     .canonicalName = L"System.Image.BitDepth",
     .plainName = L"Bit depth",
     .title = IDS_BIT_DEPTH,
     .declaredType = VT_UI4,
     .width = 5,
     .state = kText,
     .value = BitDepth,
     .storeValue = BitDepth},
    {.key = {kImageSummarySet, 12},
     .canonicalName = L"System.Media.FrameCount",
     .plainName = L"Frame count",
     .title = IDS_FRAME_COUNT,
     .declaredType = VT_UI4,
     .width = 5,
     .state = kText,
     .value = FrameCount,
     .storeValue = FrameCount},
    {.key = {kImageSummarySet, 13},
     .canonicalName = L"System.Image.Dimensions",
     .plainName = L"Dimensions",
     .title = IDS_DIMENSIONS,
     .declaredType = VT_LPWSTR,
     .width = 20,
     .state = kShownText,
     .value = Dimensions,
     .storeValue = TypedDimensions},
    {.key = {kSummarySet, PIDSI_COMMENTS},
     .canonicalName = L"System.Comment",
     .plainName = L"Comments",
     .title = IDS_COMMENTS,
     .declaredType = VT_LPWSTR,
     .width = 30,
     .state = kShownText,
     .value = Comment,
     .storeValue = TypeDescription},
}};

const Property* FindProperty(const PROPERTYKEY& key) {
  const auto* const found = std::ranges::find_if(kProperties, [&key](const Property& property) {
    return property.key.fmtid == key.fmtid && property.key.pid == key.pid;
  });
  return found != kProperties.end() ? found : nullptr;
}

}  // namespace Qel::Lumetra::ShellExt
