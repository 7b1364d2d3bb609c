// The list of file kinds. Everything that depends on the kinds is derived from this list or compared with it
// by a test; see docs/adding-a-format.md.
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
  std::uint32_t descriptionId;  // of a string that the string table intentionally lacks
};

/// One row for each file-name extension, in the order of registration. A kind has the name of its parser, for
/// instance `mrc` for MrcParser. The description in a parser's first row also applies if the extension is in
/// none of its rows. CMake and Python read these rows, too (cmake/file_kinds.cmake, file_kinds.py).
inline constexpr std::tuple kFileKinds = {
    FileKind<MrcParser>{L"mrc", 212},  // images and volumes
    FileKind<MrcParser>{L"ali", 210},  // aligned tilt series
    FileKind<MrcParser>{L"rec", 211},  // reconstructions
    FileKind<SerParser>{L"ser", 213},  // series of images
    FileKind<EbnParser>{L"ebn", 214},  // single images
    FileKind<EmiParser>{L"emi", 101},  // trees of objects
    FileKind<RawParser>{L"raw", 215},  // pixels in any order
};

/// The extensions of all rows, in the same order.
inline constexpr auto kExtensions =
    std::apply([](const auto&... kinds) { return std::array{kinds.extension...}; }, kFileKinds);

/// Calls `action` with the FileKind of an extension, compared without regard to case. Returns whether the
/// extension is known.
template <class Action>
bool WithKindOf(std::wstring_view extension, Action action) {
  const auto isKind = [&](const auto& kind) {
    const bool isIt = SameIgnoringCase(extension, kind.extension);
    if (isIt) action(kind);
    return isIt;
  };
  return std::apply([&](const auto&... kinds) { return (isKind(kinds) || ...); }, kFileKinds);
}

/// Returns the string identifier of the description of a kind's file: that of the row with its extension, or
/// else that of the kind's first row.
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
