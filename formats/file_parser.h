// What the parsers of all file kinds have in common.
#pragma once

#include <concepts>
#include <cstdint>
#include <istream>
#include <optional>
#include <string_view>

#include "frame_layout.h"

namespace Qel::Lumetra::ShellExt {

/// Why a file is not valid, for whoever explains it to its user (fault_text.h).
struct Fault {
  const char* field;                  // of the header; null for a fault of the whole file
  std::optional<std::int64_t> value;  // none for a field that is not a number
  const char* rule;                   // completes "FIELD must be"; a sentence if there is no field
};

/// The base of all parsers. A parser reads the header once, in its constructor, from the stream's position,
/// and fills in what is protected here. It sets failbit or badbit on the stream of a file that it does not
/// accept.
///
/// Nothing is virtual, because every user knows the parser's type: IsValid and comment are the answers of
/// most kinds, and a parser that differs declares its own.
class FileParser {
 public:
  std::istream& stream() const { return *stream_; }

  /// The first requirement that is not met; none for a valid file. Bytes that the file does not have count as
  /// 0.
  const std::optional<Fault>& fault() const { return fault_; }

  bool IsValid() const { return stream_->good(); }

  /// Whether the header is read as one that a big-endian machine wrote.
  bool isSwapped() const { return isSwapped_; }

  /// The frame that stands for the file. Its size and pixel type are those of the file.
  const FrameLayout& frame() const { return frame_; }

  std::int32_t frameCount() const { return frameCount_; }

  /// Free text, as the bytes of the file.
  static std::string_view comment() { return {}; }

 protected:
  explicit FileParser(std::istream& stream) : stream_(&stream) {}

  void Require(bool isMet, const char* field, std::optional<std::int64_t> value, const char* rule) {
    if (!isMet && !fault_) fault_ = {field, value, rule};
  }

  /// `sentence` says what is wrong with the whole file.
  void Require(bool isMet, const char* sentence) { Require(isMet, nullptr, {}, sentence); }

  FrameLayout frame_;
  std::int32_t frameCount_ = 1;
  bool isSwapped_ = false;

 private:
  std::istream* stream_;
  std::optional<Fault> fault_;
};

template <class T>
concept Parser = std::derived_from<T, FileParser> && std::constructible_from<T, std::istream&>;

}  // namespace Qel::Lumetra::ShellExt
