// Everything that a shell learns about one file from the extension, as plain data: collected by the worker
// process (shell_requests.h), sent to the parent process (json_records.h), shown by the reports.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// A text that may be missing, which is the empty text; null in JSON.
struct OptionalText : std::wstring {
  using std::wstring::wstring;
  using std::wstring::operator=;
  OptionalText() = default;
  OptionalText(std::wstring text) : std::wstring(std::move(text)) {}
};

/// How a file is judged, in the order of severity. The values are the exit statuses of the program.
enum class Verdict : std::int32_t {
  kGood = 0,
  kFailed = 1,  // could not be asked at all, for instance because it cannot be opened
  kUnsupported = 3,
  kDamaged = 4,
};

/// A number, a text, or nothing.
using Value = std::variant<std::monostate, std::int64_t, double, std::wstring>;

/// One of the values that a file's header has beyond the picture (header_facts.h).
struct HeaderFact {
  std::wstring name;
  Value value;  // a number is finite
  OptionalText unit;
};

/// What the project's own readers find wrong with a file, and in its header.
struct Diagnosis {
  Verdict verdict = Verdict::kGood;
  OptionalText problem;
  OptionalText advice;
  std::vector<HeaderFact> header{};
};

/// An answer that is a list. The `problem` of this and of other answers is a sentence that says why there is
/// none.
template <class Item>
struct ListAnswer {
  std::vector<Item> items;
  OptionalText problem;
};

/// The tip, as the shell would show it.
struct TipAnswer {
  OptionalText text;
  OptionalText problem;
};

/// A column of the Details view. Types are names such as "VT_I4".
struct Column {
  std::uint32_t index = 0;
  std::wstring title;
  std::wstring set;  // format id
  std::uint32_t id = 0;
  std::uint32_t characters = 0;  // default width
  std::uint32_t state = 0;       // SHCOLSTATE flags
  std::wstring declared;
  OptionalText delivered;
  Value value;
  OptionalText problem;
};

struct Property {
  OptionalText name;  // canonical name, or a plain word where there is none
  std::wstring set;   // format id
  std::uint32_t id = 0;
  OptionalText type;
  Value value;
  OptionalText problem;
};

struct Thumbnail {
  std::int32_t request = 0;  // both sides of the square that was asked for
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t bitsPerPixel = 0;
  OptionalText picture;  // where it was written, relative to the document
  OptionalText problem;
};

struct ThumbnailAnswer {
  Thumbnail thumbnail;
  std::vector<std::uint8_t> png;
};

struct FileFacts {
  std::wstring path;   // absolute
  std::wstring named;  // as on the command line; not in the document
  std::wstring name;
  std::wstring kind;  // the extension in small letters
  std::uint64_t bytes = 0;
  OptionalText modified;  // when it was last written, in UTC: 2026-11-21T15:22:03Z
  Verdict verdict = Verdict::kGood;
  OptionalText problem;  // one sentence for everything but a good file
  OptionalText advice;   // what to do about the problem, in one sentence
  OptionalText remark;   // one sentence worth knowing about a file, good or not
  OptionalText shell;    // one sentence on what Windows itself shows, where that was asked

  // From the property sets and the tip; 0 or empty where they are missing.
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t frames = 0;
  std::int32_t bitDepth = 0;
  OptionalText type;

  std::vector<HeaderFact> header;
  Thumbnail thumbnail;
  std::vector<std::uint8_t> png;  // of the thumbnail; not in the document
  TipAnswer tip;
  ListAnswer<Column> columns;
  ListAnswer<Property> propertySets;
  ListAnswer<Property> propertyStore;
};

}  // namespace Qel::Lumetra::ShellExt::Show
