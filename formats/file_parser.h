// The base class of the parsers of all file kinds.
#pragma once

#include <concepts>
#include <cstdint>
#include <istream>
#include <optional>
#include <string_view>

#include "frame_layout.h"

namespace Qel::Lumetra::ShellExt {

/// The reason why a file is not valid, which fault_text.h explains to users.
struct Fault {
  const char* field;                  // name of a header field; null for a fault of the whole file
  std::optional<std::int64_t> value;  // none for a field that is not a number
  const char* rule;                   // completes "FIELD must be"; a whole sentence without a field
};

/// A parser reads the header once, in its constructor, from the stream's position, and sets the protected
/// members. If it rejects the file, it sets failbit or badbit on the stream, which IsValid checks, or has an
/// IsValid of its own.
///
/// Nothing is virtual, because every user knows the parser's type. IsValid and comment suit most kinds; a
/// parser hides them with its own functions if it needs others.
class FileParser {
 public:
  std::istream& stream() const { return *stream_; }

  /// Returns the first requirement that is not met; nothing for a valid file. Bytes after the end of the file
  /// count as 0.
  const std::optional<Fault>& fault() const { return fault_; }

  bool IsValid() const { return stream_->good(); }

  /// Returns whether the header was written in big-endian byte order, as far as the parser can tell.
  bool isSwapped() const { return isSwapped_; }

  /// Returns the frame that represents the file. Its size and pixel type are those of the file.
  const FrameLayout& frame() const { return frame_; }

  std::int32_t frameCount() const { return frameCount_; }

  /// Returns the file's comment as bytes.
  static std::string_view comment() { return {}; }

 protected:
  explicit FileParser(std::istream& stream) : stream_(&stream) {}

  /// Records that `field` breaks `rule`, unless the rule is met or an earlier fault has been recorded.
  void Require(bool isMet, const char* field, std::optional<std::int64_t> value, const char* rule) {
    if (!isMet && !fault_) fault_ = {field, value, rule};
  }

  /// Does the same for a fault of the whole file, which `sentence` describes.
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
