// The properties of an image file that the shell knows, one row for each: the one place for their keys and
// names, for how a column shows them and for what they say.
//
// The columns (columns.h), the property sets (property_sets.h) and the property stores (property_store.h)
// give the same properties in different forms, on purpose: each of them has clients that rely on its form.
// Each of them chooses the types of its values itself.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <propidl.h>
#include <wtypes.h>

#include <array>
#include <cstdint>
#include <string>
#include <variant>

#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// The platform's property sets to which the properties belong.
inline constexpr FMTID kSummarySet{
    0xF29F85E0, 0x4FF9, 0x1068, {0xAB, 0x91, 0x08, 0x00, 0x2B, 0x27, 0xB3, 0xD9}};
inline constexpr FMTID kImageSummarySet{
    0x6444048F, 0x4C8B, 0x11D1, {0x8B, 0x70, 0x08, 0x00, 0x36, 0xB1, 0x1A, 0x03}};

/// Ids in the image summary set.
inline constexpr PROPID kWidthId = 3;
inline constexpr PROPID kHeightId = 4;

/// A number or a text.
using Metadatum = std::variant<std::int32_t, std::wstring>;

struct Property {
  PROPERTYKEY key;
  const wchar_t* canonicalName;  ///< in the property system, and so in the registry scripts
  const wchar_t* plainName;      ///< for people who look at a property set, which has no names

  // As a column. Numbers sort as texts and the declared types are not those of the values: that is how the
  // shell knows these columns.
  UINT title;  ///< a string id (string_ids.h)
  VARTYPE declaredType;
  UINT width;  ///< in characters
  DWORD state;

  // What it says of a valid file.
  Metadatum (*value)(const FileTypeInfo& reader);       ///< in a column or property set
  Metadatum (*storeValue)(const FileTypeInfo& reader);  ///< in a property store
};

/// In the order of the columns and of the property stores.
extern const std::array<Property, 6> kProperties;

/// Returns the property of that key, or null.
const Property* FindProperty(const PROPERTYKEY& key);

/// Makes a BSTR of a text, and a signed 32-bit value of the type `numberType` of a number. `value`, a VARIANT
/// or PROPVARIANT, is written on success only and then the caller's to clear; E_OUTOFMEMORY.
template <class Value>
HRESULT ToAutomationValue(const Metadatum& metadatum, VARTYPE numberType, Value& value) {
  Value made{};
  if (const auto* const text = std::get_if<std::wstring>(&metadatum)) {
    made.vt = VT_BSTR;
    made.bstrVal = SysAllocString(text->c_str());
    if (made.bstrVal == nullptr) return E_OUTOFMEMORY;
  } else {
    made.vt = numberType;
    made.lVal = std::get<std::int32_t>(metadatum);
  }
  value = made;
  return S_OK;
}

}  // namespace Qel::Lumetra::ShellExt
