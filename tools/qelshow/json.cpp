#include "json.h"

#include <array>
#include <cstdio>

#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

std::string Escape(wchar_t c) {
  std::array<char, 8> text{};
  std::snprintf(text.data(), text.size(), "\\u%04x", static_cast<unsigned>(c));
  return text.data();
}

bool IsHighSurrogate(wchar_t c) {
  return c >= 0xD800 && c <= 0xDBFF;
}

bool IsLowSurrogate(wchar_t c) {
  return c >= 0xDC00 && c <= 0xDFFF;
}

}  // namespace

std::string JsonString(std::wstring_view text) {
  std::string json = "\"";
  for (std::size_t i = 0; i < text.size(); ++i) {
    const wchar_t c = text[i];
    if (c == L'"' || c == L'\\') {
      json += '\\';
      json += static_cast<char>(c);
    } else if (c == L'\n') {
      json += "\\n";
    } else if (c == L'\r') {
      json += "\\r";
    } else if (IsHighSurrogate(c) && i + 1 < text.size() && IsLowSurrogate(text[i + 1])) {
      json += Utf8(text.substr(i, 2));
      ++i;
    } else if (c < 0x20 || c == L'<' || c == 0x2028 || c == 0x2029 || IsHighSurrogate(c) ||
               IsLowSurrogate(c)) {
      json += Escape(c);
    } else if (c < 0x80) {
      json += static_cast<char>(c);
    } else {
      json += Utf8(text.substr(i, 1));
    }
  }
  return json + '"';
}

JsonObject& JsonObject::Text(std::string_view name, std::wstring_view value) {
  return Json(name, JsonString(value));
}

JsonObject& JsonObject::TextOrNull(std::string_view name, std::wstring_view value) {
  return value.empty() ? Json(name, "null") : Text(name, value);
}

JsonObject& JsonObject::Number(std::string_view name, std::int64_t value) {
  return Json(name, std::to_string(value));
}

JsonObject& JsonObject::Json(std::string_view name, std::string_view json) {
  if (text_.size() > 1) text_ += ',';
  text_.append("\"").append(name).append("\":").append(json);
  return *this;
}

std::string JsonObject::Take() {
  return std::move(text_) + '}';
}

}  // namespace Qel::Lumetra::ShellExt::Show
