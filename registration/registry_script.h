// The language of the registry scripts, in which the server lists its keys and values, and the parsed form of
// a script.
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
// Names and strings are bare or in single quotes. A quoted string may contain white space, braces, the equals
// sign and, doubled, the quote itself. Case does not matter in keywords, roots and replacement names. A
// keyword used as a name must be quoted. Scripts are plain ASCII; only replacements may contain other
// characters.
//
// registrar.h describes how keys are registered and unregistered. Nothing here calls Windows, so the parser
// is tested and fuzzed natively as well.
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
  kNone,         ///< created if missing; deleted once nothing is left in it
  kForceRemove,  ///< recreated empty; deleted with everything below it
  kNoRemove,     ///< created if missing; never deleted
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

/// The keys in the order of the script. A key directly precedes the keys inside it, which are the following
/// ones of greater depth.
using RegistryScript = std::vector<ScriptKey>;

/// The maximum nesting of keys, which is the number of levels that the registry creates in one call.
inline constexpr std::size_t kMaxKeyNesting = 32;

/// Replaces `%name%` in a script with `value`. The replacement happens before the script is parsed, so a
/// value that is used inside quotes must double its own quotes.
struct Replacement {
  std::wstring name;
  std::wstring value;
};

/// Parses a script. Returns nothing for a string that is not a valid script: a syntax error, an unknown root
/// or replacement, a byte that is neither printable ASCII nor white space, a key name that is empty or
/// contains a backslash, a number of more than 32 bits, or keys nested deeper than kMaxKeyNesting. The first
/// of two replacements with the same name wins.
std::optional<RegistryScript> ParseRegistryScript(std::string_view text,
                                                  std::span<const Replacement> replacements);

}  // namespace Qel::Lumetra::ShellExt
