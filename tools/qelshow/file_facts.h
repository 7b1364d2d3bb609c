// Everything that a shell learns about one file from the extension, as plain data: made by the worker process
// that asks (shell_requests.h), carried to the parent process (message.h), shown by the reports.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// How a file is judged, in the order of severity. The values are the exit statuses of the program.
enum class Verdict : std::int32_t {
  kGood = 0,
  kFailed = 1,  // could not be asked at all, for instance because it cannot be opened
  kUnsupported = 3,
  kDamaged = 4,
};

/// What the project's own readers find wrong with a file.
struct Diagnosis {
  Verdict verdict = Verdict::kGood;
  std::wstring sentence;  // empty for a good file
};

/// An answer that is a list. `problem` says in a sentence why there is none, and is empty otherwise.
template <class Item>
struct ListAnswer {
  std::vector<Item> items;
  std::wstring problem;
};

/// The tip, as the shell would show it.
struct TipAnswer {
  std::wstring text;
  std::wstring problem;
};

/// A column of the Details view. Types are names such as "VT_I4".
struct Column {
  std::uint32_t index = 0;
  std::wstring title;
  std::wstring set;  // format id
  std::uint32_t id = 0;
  std::uint32_t characters = 0;  // default width
  std::uint32_t state = 0;       // SHCOLSTATE flags
  std::wstring declaredType;
  std::wstring deliveredType;
  std::wstring value;
  std::wstring problem;  // why nothing was delivered
};

struct Property {
  std::wstring name;  // canonical name, or a plain word where there is none
  std::wstring set;   // format id
  std::uint32_t id = 0;
  std::wstring type;
  std::wstring value;
  std::wstring problem;  // why nothing was delivered
};

struct Thumbnail {
  std::int32_t request = 0;  // both sides of the square that was asked for
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t bits = 0;  // of one pixel
  std::vector<std::uint8_t> png;
  std::wstring problem;  // why there is no picture
};

struct FileFacts {
  std::wstring path;  // as it was named on the command line
  std::wstring name;
  std::wstring kind;  // the extension in small letters
  std::uint64_t bytes = 0;
  Verdict verdict = Verdict::kGood;
  std::wstring problem;  // one sentence for everything but a good file
  std::wstring remark;   // one sentence worth knowing about a file, good or not

  // What the columns and the tip say; 0 or empty when they say nothing.
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t frames = 0;
  std::int32_t bitDepth = 0;
  std::wstring type;

  Thumbnail thumbnail;
  TipAnswer tip;
  ListAnswer<Column> columns;
  ListAnswer<Property> propertySets;
  ListAnswer<Property> propertyStore;
};

}  // namespace Qel::Lumetra::ShellExt::Show
