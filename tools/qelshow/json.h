// Writes JSON (RFC 8259) as UTF-8.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Show {

/// A quoted JSON string. It holds no '<', so that it can stand in a script element of a page; half of a
/// surrogate pair, which a file name may hold, is written as an escape.
std::string JsonString(std::wstring_view text);

/// An object under construction, one member after the other.
class JsonObject {
 public:
  JsonObject& Text(std::string_view name, std::wstring_view value);
  JsonObject& TextOrNull(std::string_view name, std::wstring_view value);  // null for an empty text
  JsonObject& Number(std::string_view name, std::int64_t value);

  /// `json` is a finished JSON value.
  JsonObject& Json(std::string_view name, std::string_view json);

  std::string Take();

 private:
  std::string text_ = "{";
};

/// A finished array of finished JSON values, which `toJson` makes of the items.
template <class Items, class ToJson>
std::string JsonArray(const Items& items, ToJson toJson) {
  std::string text = "[";
  for (const auto& item : items) {
    if (text.size() > 1) text += ',';
    text += toJson(item);
  }
  return text + ']';
}

}  // namespace Qel::Lumetra::ShellExt::Show
