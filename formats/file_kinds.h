// The list of file kinds. What depends on the kinds is derived from it or compared with it by a test, see
// docs/adding-a-format.md.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string_view>
#include <tuple>
#include <type_traits>

#include "ebn_parser.h"
#include "emi_parser.h"
#include "mrc_parser.h"
#include "raw_parser.h"
#include "same_text.h"
#include "ser_parser.h"

namespace Qel::Lumetra::ShellExt {

template <Parser KindParser>
struct FileKind {
  std::wstring_view extension;  // without the dot, in lower case
  std::uint32_t descriptionId;  // of a text that the string table does not have
};

/// One row for each extension, in the order of registration. The first row of a parser has its own
/// description, the others those of its other extensions. CMake and Python scripts read the rows as well
/// (kinds.cmake, kinds.py).
inline constexpr std::tuple kFileKinds = {
    FileKind<MrcParser>{L"mrc", 212}, FileKind<MrcParser>{L"ali", 210}, FileKind<MrcParser>{L"rec", 211},
    FileKind<SerParser>{L"ser", 213}, FileKind<EbnParser>{L"ebn", 214}, FileKind<EmiParser>{L"emi", 101},
    FileKind<RawParser>{L"raw", 215},
};

/// Their extensions.
inline constexpr auto kExtensions =
    std::apply([](const auto&... kinds) { return std::array{kinds.extension...}; }, kFileKinds);

/// Calls `action` with the FileKind of an extension, compared without regard to case; not for an unknown one.
template <class Action>
void WithKindOf(std::wstring_view extension, Action action) {
  const auto actIfSame = [&](const auto& kind) {
    if (SameIgnoringCase(extension, kind.extension)) action(kind);
  };
  std::apply([&](const auto&... kinds) { (actIfSame(kinds), ...); }, kFileKinds);
}

/// The id of the description of a kind's file: that of the row with its extension, or else of the kind's
/// first.
template <Parser KindParser>
std::uint32_t DescriptionId(std::wstring_view extension) {
  std::optional<std::uint32_t> id;
  const auto choose = [&]<class RowParser>(const FileKind<RowParser>& kind) {
    if constexpr (std::is_same_v<RowParser, KindParser>) {
      if (!id || SameIgnoringCase(extension, kind.extension)) id = kind.descriptionId;
    }
  };
  std::apply([&](const auto&... kinds) { (choose(kinds), ...); }, kFileKinds);
  return id.value();
}

}  // namespace Qel::Lumetra::ShellExt
