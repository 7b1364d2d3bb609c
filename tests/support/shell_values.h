// The properties that the shell requests, and their values in a form that tests can compare and print.
#pragma once

#include <windows.h>

#include <oaidl.h>
#include <propidl.h>
#include <propsys.h>

#include <cstdint>
#include <ostream>
#include <string>
#include <utility>

namespace Qel::Lumetra::ShellExt::Testing {

inline constexpr FMTID kSummary{0xF29F85E0, 0x4FF9, 0x1068, {0xAB, 0x91, 0x08, 0x00, 0x2B, 0x27, 0xB3, 0xD9}};
inline constexpr FMTID kImageSummary{
    0x6444048F, 0x4C8B, 0x11D1, {0x8B, 0x70, 0x08, 0x00, 0x36, 0xB1, 0x1A, 0x03}};

/// A property set that no image file has.
inline constexpr FMTID kOtherSet{
    0x6444048F, 0x4C8B, 0x11D1, {0x8B, 0x70, 0x08, 0x00, 0x36, 0xB1, 0x1A, 0x04}};

inline constexpr PROPERTYKEY kWidthKey{kImageSummary, 3};
inline constexpr PROPERTYKEY kHeightKey{kImageSummary, 4};
inline constexpr PROPERTYKEY kBitDepthKey{kImageSummary, 7};
inline constexpr PROPERTYKEY kFrameCountKey{kImageSummary, 12};
inline constexpr PROPERTYKEY kDimensionsKey{kImageSummary, 13};
inline constexpr PROPERTYKEY kCommentsKey{kSummary, 6};
inline constexpr PROPERTYKEY kAllKeys[] = {kWidthKey,      kHeightKey,     kBitDepthKey,
                                           kFrameCountKey, kDimensionsKey, kCommentsKey};

/// The type of a value, and its number or string.
struct Value {
  VARTYPE type = VT_EMPTY;
  std::int64_t number = 0;
  std::wstring text;

  friend bool operator==(const Value&, const Value&) = default;
};

inline Value Number(VARTYPE type, std::int64_t number) {
  return {type, number, {}};
}
inline Value Text(VARTYPE type, std::wstring text) {
  return {type, 0, std::move(text)};
}

/// Reads a VARIANT or PROPVARIANT. Returns the string "<unexpected>" for a null string, and for a type that
/// the extension does not use.
template <class Variant>
Value ReadValue(const Variant& variant) {
  switch (variant.vt) {
    case VT_EMPTY: return {};
    case VT_I4: return Number(VT_I4, variant.lVal);
    case VT_INT: return Number(VT_INT, variant.intVal);
    case VT_UI4: return Number(VT_UI4, variant.ulVal);
    case VT_BSTR:
      if (variant.bstrVal == nullptr) break;
      return Text(VT_BSTR, {variant.bstrVal, SysStringLen(variant.bstrVal)});
    default: break;
  }
  if constexpr (requires { variant.pwszVal; }) {
    if (variant.vt == VT_LPWSTR && variant.pwszVal != nullptr) return Text(VT_LPWSTR, variant.pwszVal);
  }
  return Text(variant.vt, L"<unexpected>");
}

inline Value TakeValue(PROPVARIANT& variant) {
  Value value = ReadValue(variant);
  PropVariantClear(&variant);
  return value;
}

inline Value TakeValue(VARIANT& variant) {
  Value value = ReadValue(variant);
  VariantClear(&variant);
  return value;
}

/// Prints a value in the message of a failed test.
inline void PrintTo(const Value& value, std::ostream* stream) {
  *stream << "type " << value.type << ", " << value.number << ", \"";
  for (const wchar_t c : value.text) *stream << (c < 0x80 ? static_cast<char>(c) : '?');
  *stream << '"';
}

}  // namespace Qel::Lumetra::ShellExt::Testing
