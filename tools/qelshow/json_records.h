// Converts the records of this program to JSON for documents, and to CBOR for the messages between the
// program and its worker process. One description of a record serves both.
#pragma once

#include <cstdint>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "file_facts.h"
#include "question.h"
#include "text_tools.h"

/// Strings are UTF-8. Half of a surrogate pair, which UTF-8 cannot represent, becomes U+FFFD.
template <>
struct nlohmann::adl_serializer<std::wstring> {
  static void to_json(nlohmann::json& json, const std::wstring& text) {
    json = Qel::Lumetra::ShellExt::Show::Utf8(text);
  }
  static void from_json(const nlohmann::json& json, std::wstring& text) {
    text = Qel::Lumetra::ShellExt::Show::Wide(json.get_ref<const std::string&>());
  }
};

template <>
struct nlohmann::adl_serializer<Qel::Lumetra::ShellExt::Show::Value> {
  static void to_json(nlohmann::json& json, const Qel::Lumetra::ShellExt::Show::Value& value) {
    if (const auto* const number = std::get_if<std::int64_t>(&value)) json = *number;
    if (const auto* const number = std::get_if<double>(&value)) json = *number;
    if (const auto* const text = std::get_if<std::wstring>(&value)) json = *text;
  }
  static void from_json(const nlohmann::json& json, Qel::Lumetra::ShellExt::Show::Value& value) {
    if (json.is_number_integer()) value = json.get<std::int64_t>();
    if (json.is_number_float()) value = json.get<double>();
    if (json.is_string()) value = json.get<std::wstring>();
  }
};

namespace Qel::Lumetra::ShellExt::Show {

using Json = nlohmann::json;

/// The version of the documents. It changes when a member is renamed or removed, or when the meaning or the
/// fixed values of a member change; a new member does not change it.
inline constexpr int kJsonSchema = 3;

inline void to_json(Json& json, const OptionalText& text) {
  if (!text.empty()) json = Utf8(text);
}

inline void from_json(const Json& json, OptionalText& text) {
  text = json.is_null() ? std::wstring() : json.get<std::wstring>();
}

NLOHMANN_JSON_SERIALIZE_ENUM(Verdict, {{Verdict::kGood, "good"},
                                       {Verdict::kFailed, "failed"},
                                       {Verdict::kUnsupported, "unsupported"},
                                       {Verdict::kNoThumbnail, "no thumbnail"}})

template <class Item>
void to_json(Json& json, const ListAnswer<Item>& answer) {
  json = {{"items", answer.items}, {"problem", answer.problem}};
}

template <class Item>
void from_json(const Json& json, ListAnswer<Item>& answer) {
  json.at("items").get_to(answer.items);
  json.at("problem").get_to(answer.problem);
}

NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(HeaderFact, name, value, unit)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(Diagnosis, verdict, problem, advice, header)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(TipAnswer, text, problem)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(Column, index, title, set, id, characters, state, declared, returned,
                                   value, problem)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(Property, name, set, id, type, value, problem)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(Thumbnail, request, width, height, bitsPerPixel, file, problem)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(FileFacts, path, name, kind, bytes, modified, verdict, problem, advice,
                                   remark, shell, width, height, frames, bitDepth, type, header, thumbnail,
                                   tip, columns, propertySets, propertyStore)

inline void to_json(Json& json, const ThumbnailAnswer& answer) {
  json = {{"thumbnail", answer.thumbnail}, {"png", Json::binary(answer.png)}};
}

inline void from_json(const Json& json, ThumbnailAnswer& answer) {
  json.at("thumbnail").get_to(answer.thumbnail);
  answer.png = json.at("png").get_binary();
}

inline void to_json(Json& json, const Question& question) {
  // A path is sent as its UTF-16 code units, because UTF-8 cannot represent every file name.
  const std::vector<std::uint16_t> path(question.path.begin(), question.path.end());
  json = {{"subject", question.subject}, {"path", path}, {"size", question.size}};
}

inline void from_json(const Json& json, Question& question) {
  json.at("subject").get_to(question.subject);
  const auto path = json.at("path").get<std::vector<std::uint16_t>>();
  question.path.assign(path.begin(), path.end());
  json.at("size").get_to(question.size);
}

}  // namespace Qel::Lumetra::ShellExt::Show
