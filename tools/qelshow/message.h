// The bytes in which questions and answers travel between the program and its worker process. Both are the
// same program, so numbers and lengths go as they lie in memory; a type is described once, in Exchange, for
// both directions.
#pragma once

#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

class MessageWriter {
 public:
  template <class... Values>
  void operator()(Values&... values) {
    (Add(values), ...);
  }

  std::string Take() { return std::move(bytes_); }

 private:
  void AddBytes(const void* data, std::size_t size) { bytes_.append(static_cast<const char*>(data), size); }

  template <class Character>
  void Add(std::basic_string<Character>& text) {
    AddSize(text.size());
    AddBytes(text.data(), text.size() * sizeof(Character));
  }

  template <class Item>
  void Add(std::vector<Item>& items) {
    AddSize(items.size());
    for (Item& item : items) Add(item);
  }

  template <class Value>
  void Add(Value& value) {
    if constexpr (std::is_arithmetic_v<Value> || std::is_enum_v<Value>) {
      AddBytes(&value, sizeof value);
    } else {
      Exchange(*this, value);
    }
  }

  void AddSize(std::uint64_t size) { AddBytes(&size, sizeof size); }

  std::string bytes_;
};

/// Reads from bytes that must outlive it. Throws std::runtime_error for bytes that are no such message.
class MessageReader {
 public:
  explicit MessageReader(std::string_view bytes) : bytes_(bytes) {}

  template <class... Values>
  void operator()(Values&... values) {
    (Get(values), ...);
  }

 private:
  void GetBytes(void* data, std::size_t size) {
    if (size > bytes_.size() - position_) throw std::runtime_error("message too short");
    if (size > 0) std::memcpy(data, bytes_.data() + position_, size);
    position_ += size;
  }

  /// A count of items of at least `itemBytes` bytes each, which the message must hold.
  std::size_t GetSize(std::size_t itemBytes) {
    std::uint64_t size = 0;
    GetBytes(&size, sizeof size);
    if (size > (bytes_.size() - position_) / itemBytes) throw std::runtime_error("message too short");
    return static_cast<std::size_t>(size);
  }

  template <class Character>
  void Get(std::basic_string<Character>& text) {
    text.resize(GetSize(sizeof(Character)));
    GetBytes(text.data(), text.size() * sizeof(Character));
  }

  template <class Item>
  void Get(std::vector<Item>& items) {
    items.resize(GetSize(1));
    for (Item& item : items) Get(item);
  }

  template <class Value>
  void Get(Value& value) {
    if constexpr (std::is_arithmetic_v<Value> || std::is_enum_v<Value>) {
      GetBytes(&value, sizeof value);
    } else {
      Exchange(*this, value);
    }
  }

  std::string_view bytes_;
  std::size_t position_ = 0;
};

/// What can be asked: about a file, and whether a registered class makes objects.
enum class Subject : std::int32_t {
  kDiagnosis,
  kTip,
  kColumns,
  kPropertySets,
  kPropertyStore,
  kThumbnail,
  kCreation
};

struct Question {
  Subject subject = Subject::kDiagnosis;
  std::wstring path;      // of the file; of kCreation the class identifier
  std::int32_t size = 0;  // of a thumbnail
};

template <class Archive>
void Exchange(Archive& archive, Question& question) {
  archive(question.subject, question.path, question.size);
}

template <class Archive, class Item>
void Exchange(Archive& archive, ListAnswer<Item>& answer) {
  archive(answer.items, answer.problem);
}

template <class Archive>
void Exchange(Archive& archive, Diagnosis& diagnosis) {
  archive(diagnosis.verdict, diagnosis.sentence);
}

template <class Archive>
void Exchange(Archive& archive, TipAnswer& answer) {
  archive(answer.text, answer.problem);
}

template <class Archive>
void Exchange(Archive& archive, Column& column) {
  archive(column.index, column.title, column.set, column.id, column.characters, column.state,
          column.declaredType, column.deliveredType, column.value, column.problem);
}

template <class Archive>
void Exchange(Archive& archive, Property& property) {
  archive(property.name, property.set, property.id, property.type, property.value, property.problem);
}

template <class Archive>
void Exchange(Archive& archive, Thumbnail& thumbnail) {
  archive(thumbnail.request, thumbnail.width, thumbnail.height, thumbnail.bits, thumbnail.png,
          thumbnail.problem);
}

template <class Value>
std::string Packed(Value value) {
  MessageWriter writer;
  writer(value);
  return writer.Take();
}

template <class Value>
Value Unpacked(std::string_view message) {
  Value value;
  MessageReader reader(message);
  reader(value);
  return value;
}

}  // namespace Qel::Lumetra::ShellExt::Show
