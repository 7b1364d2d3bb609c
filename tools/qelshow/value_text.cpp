#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

std::wstring TextOrEmpty(const wchar_t* text) {
  return text == nullptr ? std::wstring() : std::wstring(text);
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

std::wstring ValueText(const PROPVARIANT& value) {
  switch (value.vt) {
    case VT_I4: return std::to_wstring(value.lVal);
    case VT_INT: return std::to_wstring(value.intVal);
    case VT_UI4: return std::to_wstring(value.ulVal);
    case VT_BSTR: return TextOrEmpty(value.bstrVal);
    case VT_LPWSTR: return TextOrEmpty(value.pwszVal);
    default: return {};
  }
}

std::wstring ValueText(const VARIANT& value) {
  switch (value.vt) {
    case VT_I4: return std::to_wstring(value.lVal);
    case VT_INT: return std::to_wstring(value.intVal);
    case VT_UI4: return std::to_wstring(value.ulVal);
    case VT_BSTR: return TextOrEmpty(value.bstrVal);
    default: return {};
  }
}

}  // namespace Qel::Lumetra::ShellExt::Show
