// The properties of an image file that the shell knows, one row each: the only place that defines their keys
// and names, the form of their columns and the functions that read their values.
//
// The columns (columns.h), the property sets (property_sets.h) and the property stores (property_store.h)
// return the same properties in different forms. Intentional: each form has clients that rely on it. Each of
// the three chooses the types of its values itself.
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

/// The system's property sets that contain the properties.
inline constexpr FMTID kSummarySet{
    0xF29F85E0, 0x4FF9, 0x1068, {0xAB, 0x91, 0x08, 0x00, 0x2B, 0x27, 0xB3, 0xD9}};
inline constexpr FMTID kImageSummarySet{
    0x6444048F, 0x4C8B, 0x11D1, {0x8B, 0x70, 0x08, 0x00, 0x36, 0xB1, 0x1A, 0x03}};

/// Identifiers in the image summary set.
inline constexpr PROPID kWidthId = 3;
inline constexpr PROPID kHeightId = 4;

/// A number or a string.
using Metadatum = std::variant<std::int32_t, std::wstring>;

struct Property {
  PROPERTYKEY key;
  const wchar_t* canonicalName;  ///< as in the property system and the registry scripts
  const wchar_t* plainName;      ///< for display: a property set has no names

  // The column. It sorts numbers as strings, and its declared type is not always the type of its values.
  // Intentional: the shell knows the columns in this form.
  UINT title;  ///< a string identifier (string_ids.h)
  VARTYPE declaredType;
  UINT width;  ///< in characters
  DWORD state;

  // The functions that return the value for a valid file.
  Metadatum (*value)(const FileTypeInfo& reader);       ///< in a column or property set
  Metadatum (*storeValue)(const FileTypeInfo& reader);  ///< in a property store
};

/// The properties in the order of the columns and of the property stores.
extern const std::array<Property, 6> kProperties;

/// Returns the property with the key `key`, or null.
const Property* FindProperty(const PROPERTYKEY& key);

/// Makes a BSTR from a string, or a signed 32-bit value with the type `numberType` from a number. Returns
/// E_OUTOFMEMORY if there is no memory for the BSTR. `value`, a VARIANT or PROPVARIANT, is written on success
/// only; the caller clears it.
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
