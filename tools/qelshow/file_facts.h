// Everything that the shell gets from the extension for one file, as plain data. The worker process collects
// it (shell_requests.h) and sends it to the parent process (json_records.h), which reports it.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// A string that may be missing. A missing string is empty here and null in JSON.
struct OptionalText : std::wstring {
  using std::wstring::wstring;
  using std::wstring::operator=;
  OptionalText() = default;
  OptionalText(std::wstring text) : std::wstring(std::move(text)) {}
};

/// The verdicts on a file, in the order of severity. The values are exit statuses of the program.
enum class Verdict : std::int32_t {
  kGood = 0,
  kFailed = 1,  // could not be examined, for instance because it cannot be opened
  kUnsupported = 3,
  kNoThumbnail = 4,  // of a supported kind, but for instance damaged
};

/// A number, a string, or nothing.
using Value = std::variant<std::monostate, std::int64_t, double, std::wstring>;

/// A value of a file's header that does not describe the frame (header_facts.h).
struct HeaderFact {
  std::wstring name;
  Value value;  // a number is finite
  OptionalText unit;
};

/// What the project's own readers find in a file: its fault, and the facts of its header.
struct Diagnosis {
  Verdict verdict = Verdict::kGood;
  OptionalText problem;
  OptionalText advice;
  std::vector<HeaderFact> header{};
};

/// An answer that is a list. The `problem` of this and other answers is a sentence that says why it is
/// missing.
template <class Item>
struct ListAnswer {
  std::vector<Item> items;
  OptionalText problem;
};

/// The tip that the shell would show.
struct TipAnswer {
  OptionalText text;
  OptionalText problem;
};

/// A column of the Details view. Types are strings such as "VT_I4".
struct Column {
  std::uint32_t index = 0;
  std::wstring title;
  std::wstring set;  // format id
  std::uint32_t id = 0;
  std::uint32_t characters = 0;  // default width
  std::uint32_t state = 0;       // SHCOLSTATE flags
  std::wstring declared;
  OptionalText returned;
  Value value;
  OptionalText problem;
};

struct Property {
  OptionalText name;  // canonical name in a property store, plain word in a property set
  std::wstring set;   // format id
  std::uint32_t id = 0;
  OptionalText type;
  Value value;
  OptionalText problem;
};

struct Thumbnail {
  std::int32_t request = 0;  // the edge of the requested square
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t bitsPerPixel = 0;
  OptionalText file;  // in a page: the path of its PNG file, relative to the page
  OptionalText problem;
};

struct ThumbnailAnswer {
  Thumbnail thumbnail;
  std::vector<std::uint8_t> png;
};

struct FileFacts {
  std::wstring path;   // absolute
  std::wstring named;  // as on the command line; not in the JSON
  std::wstring name;
  std::wstring kind;  // the file-name extension in lower case, without the dot
  std::uint64_t bytes = 0;
  OptionalText modified;  // when it was last written, in UTC: 2026-11-21T15:22:03Z
  Verdict verdict = Verdict::kGood;
  OptionalText problem;  // a sentence for every file that is not good
  OptionalText advice;   // a sentence about what to do
  OptionalText remark;   // something else to know about the file, good or not
  OptionalText shell;    // what Windows itself shows, if it was asked

  // From the property sets and the tip; 0 or empty if they are missing.
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t frames = 0;
  std::int32_t bitDepth = 0;
  OptionalText type;

  std::vector<HeaderFact> header;
  Thumbnail thumbnail;
  std::vector<std::uint8_t> png;  // the thumbnail; not in the JSON
  TipAnswer tip;
  ListAnswer<Column> columns;
  ListAnswer<Property> propertySets;
  ListAnswer<Property> propertyStore;
};

}  // namespace Qel::Lumetra::ShellExt::Show
