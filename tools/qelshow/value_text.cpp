#include "value_text.h"

#include <array>
#include <charconv>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Show {
namespace {

std::wstring TextOrEmpty(const wchar_t* text) {
  return text == nullptr ? std::wstring() : std::wstring(text);
}

/// Returns the shortest text that reads back as the same number.
std::wstring ShortestText(double number) {
  std::array<char, 32> text;
  const auto end = std::to_chars(text.data(), text.data() + text.size(), number);
  return {text.data(), end.ptr};
}

}  // namespace

std::wstring TypeName(VARTYPE type) {
  switch (type) {
    case VT_EMPTY: return L"VT_EMPTY";
    case VT_I4: return L"VT_I4";
    case VT_INT: return L"VT_INT";
    case VT_UI4: return L"VT_UI4";
    case VT_BSTR: return L"VT_BSTR";
    case VT_LPWSTR: return L"VT_LPWSTR";
    default: return std::to_wstring(type);
  }
}

Value ValueOf(const PROPVARIANT& value) {
  switch (value.vt) {
    case VT_I4: return value.lVal;
    case VT_INT: return value.intVal;
    case VT_UI4: return value.ulVal;
    case VT_BSTR: return TextOrEmpty(value.bstrVal);
    case VT_LPWSTR: return TextOrEmpty(value.pwszVal);
    default: return {};
  }
}

Value ValueOf(const VARIANT& value) {
  switch (value.vt) {
    case VT_I4: return value.lVal;
    case VT_INT: return value.intVal;
    case VT_UI4: return value.ulVal;
    case VT_BSTR: return TextOrEmpty(value.bstrVal);
    default: return {};
  }
}

std::wstring ValueText(const Value& value) {
  if (const auto* const number = std::get_if<std::int64_t>(&value)) return std::to_wstring(*number);
  if (const auto* const number = std::get_if<double>(&value)) return ShortestText(*number);
  if (const auto* const text = std::get_if<std::wstring>(&value)) return *text;
  return {};
}

}  // namespace Qel::Lumetra::ShellExt::Show
