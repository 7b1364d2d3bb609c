// Tests the strings of JSON documents, and the questions that are sent to the worker process.
#include "json_records.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

std::string Written(const std::wstring& text) {
  return Json(text).dump();
}

TEST(JsonRecords, EscapesTheCharactersThatAJsonStringCannotContain) {
  EXPECT_EQ(Written(L"\x1F \" \\ \n"), R"("\u001f \" \\ \n")");
  EXPECT_EQ(Written(L"\x20"), "\" \"");
}

TEST(JsonRecords, WritesEveryOtherCharacterAsUtf8) {
  EXPECT_EQ(Written(L"\u00e9 \u2028 \u2029 \U0001F52C"),
            "\"\xC3\xA9 \xE2\x80\xA8 \xE2\x80\xA9 \xF0\x9F\x94\xAC\"");
}

TEST(JsonRecords, WritesHalfOfASurrogatePairAsTheReplacementCharacter) {
  const std::string replacement = "\"\xEF\xBF\xBD\"";
  for (const wchar_t half : {L'\xD800', L'\xDBFF', L'\xDC00', L'\xDFFF'}) {
    EXPECT_EQ(Written(std::wstring(1, half)), replacement) << static_cast<int>(half);
  }
  EXPECT_EQ(Written({0xDC00, 0xD800}), "\"\xEF\xBF\xBD\xEF\xBF\xBD\"");
}

TEST(JsonRecords, WriteAnEmptyOptionalStringAsNull) {
  Property property;
  EXPECT_TRUE(Json(property).at("problem").is_null());
  EXPECT_EQ(Json(property).at("set"), "");
  property.problem = L"none";
  EXPECT_EQ(Json(property).at("problem"), "none");
  EXPECT_EQ(Json(property).get<Property>().problem, L"none");
  EXPECT_EQ(Json(Property()).get<Property>().problem, L"");
}

TEST(JsonRecords, KeepWholeNumbersApartFromOthers) {
  for (const Value& value : {Value(), Value(std::int64_t{2}), Value(2.0), Value(1.2e-9), Value(L"2")}) {
    EXPECT_EQ(Json::from_cbor(Json::to_cbor(Json(value))).get<Value>(), value) << Written(ValueText(value));
  }
  EXPECT_EQ(Json(Value(1.2e-9)).dump(), "1.2e-09");
}

TEST(JsonRecords, KeepEveryPathInAQuestion) {
  const std::wstring path = {L'a', 0xDC00, 0xD83D, 0xDD2C, 0xFFFF};
  const auto received =
      Json::from_cbor(Json::to_cbor(Question{Subject::kThumbnail, path, 256})).get<Question>();
  EXPECT_EQ(received.subject, Subject::kThumbnail);
  EXPECT_EQ(received.path, path);
  EXPECT_EQ(received.size, 256);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show
