// How a metadatum of an image file becomes what the shell shows: the one place that knows.
//
// The shell asks in four ways: the info tip (info_tip.h), the columns of its Details view (columns.h), the
// property sets (property_sets.h) and the property stores (property_store.h). They give the same facts in
// different forms, on purpose; metadata.cpp shows the differences side by side, with the reason of each.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <propidl.h>
#include <wtypes.h>

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <variant>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// The property sets of the platform to which the properties belong.
inline constexpr FMTID kSummarySet{
    0xF29F85E0, 0x4FF9, 0x1068, {0xAB, 0x91, 0x08, 0x00, 0x2B, 0x27, 0xB3, 0xD9}};
inline constexpr FMTID kImageSummarySet{
    0x6444048F, 0x4C8B, 0x11D1, {0x8B, 0x70, 0x08, 0x00, 0x36, 0xB1, 0x1A, 0x03}};

/// Property ids of the image summary set.
enum ImageSummaryId : PROPID {
  kWidthId = 3,
  kHeightId = 4,
  kHorizontalResolutionId = 5,
  kVerticalResolutionId = 6,
  kBitDepthId = 7,
  kFrameCountId = 12,
  kDimensionsId = 13,
};

/// The properties that are listed to the shell, in the order of the columns and of the property stores.
inline constexpr std::array<PROPERTYKEY, 6> kListedProperties{{
    {kImageSummarySet, kWidthId},
    {kImageSummarySet, kHeightId},
    {kImageSummarySet, kBitDepthId},
    {kImageSummarySet, kFrameCountId},
    {kImageSummarySet, kDimensionsId},
    {kSummarySet, PIDSI_COMMENTS},
}};

/// A number or a text.
using Metadatum = std::variant<std::int32_t, std::wstring>;

/// The ways in which the shell asks for properties one by one.
enum class View { kColumn, kPropertySet, kPropertyStore };

/// What `view` answers for the property `key` of a valid file; nothing for a property that it does not have.
std::optional<Metadatum> FindMetadatum(View view, const FileTypeInfo& file, const PROPERTYKEY& key);

/// The first line of the info tip, without its label.
std::wstring TipDimensions(const FileTypeInfo& file);

// A metadatum in the type of each view. `value` is written on success only and then the caller's to clear; a
// text that cannot be allocated is a failure.
HRESULT ToColumnValue(const Metadatum& metadatum, VARIANT& value);
HRESULT ToPropertySetValue(const Metadatum& metadatum, PROPVARIANT& value);
HRESULT ToPropertyStoreValue(const Metadatum& metadatum, PROPVARIANT& value);

}  // namespace Qel::Lumetra::ShellExt
