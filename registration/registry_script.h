// The language of the registry scripts, in which the server says which keys and values it has, and the
// parsed form of a script.
//
//   HKCR
//   {
//     NoRemove CLSID
//     {
//       ForceRemove '{79E696A1-2FA5-4b3e-9610-D5F760417E62}' = s 'A title'
//       {
//         val ManualSafeSave = d '1'
//         InprocServer32 = s '%MODULE%'
//       }
//     }
//   }
//
// Names and texts stand bare or in single quotes; quotes admit white space, braces, the equals sign and,
// doubled, the quote itself. Keywords, roots and replacement names are recognised whatever their case; a
// keyword that is meant as a name is quoted. Scripts are plain ASCII, only replacements bring in other
// letters.
//
// registrar.h says what registering and unregistering do to the keys. Nothing
// here calls Windows, so the parser is tested and fuzzed natively as well.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace Qel::Lumetra::ShellExt {

enum class RegistryRoot { kClassesRoot, kLocalMachine };

/// A string value (`s`) or a DWORD value (`d`).
using RegistryData = std::variant<std::wstring, std::uint32_t>;

enum class KeyMark {
  kNone,         ///< made if missing; removed again once nothing is left in it
  kForceRemove,  ///< made anew; removed with everything below it
  kNoRemove,     ///< made if missing; never removed
};

struct ScriptValue {
  std::wstring name;
  RegistryData data;
};

struct ScriptKey {
  RegistryRoot root{};
  std::size_t depth = 0;  ///< number of keys between the root and this one
  KeyMark mark = KeyMark::kNone;
  std::wstring name;
  std::optional<RegistryData> defaultValue;
  std::vector<ScriptValue> values;
};

/// The keys in the order of the text: a key stands directly before the keys inside it, which are those that
/// follow with a greater depth.
using RegistryScript = std::vector<ScriptKey>;

/// No script nests deeper: the registry creates at most this many levels in one call.
inline constexpr std::size_t kMaxKeyNesting = 32;

/// `%name%` in a script stands for `value`. The script is read after its replacements have been made, so a
/// value that is meant for quotes has its own quotes doubled.
struct Replacement {
  std::wstring name;
  std::wstring value;
};

/// Nothing for a text that is not a script: broken syntax, an unknown root or replacement, a byte that is
/// not printable ASCII or white space, a key name that is empty or holds a backslash, a number beyond
/// 32 bits, or keys nested deeper than kMaxKeyNesting. Of two replacements of the same name the first counts.
std::optional<RegistryScript> ParseRegistryScript(std::string_view text,
                                                  std::span<const Replacement> replacements);

}  // namespace Qel::Lumetra::ShellExt
