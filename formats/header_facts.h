// What a header says beyond the picture, for whoever shows it to the file's user. The shell extension itself
// does not use this.
#pragma once

#include <cstdint>
#include <istream>
#include <string>
#include <variant>
#include <vector>

namespace Qel::Lumetra::ShellExt {

struct HeaderFact {
  std::string name;                                       // in English
  std::variant<std::int64_t, double, std::string> value;  // a text has the bytes of the file
  std::string unit{};  // may be the file's own words; empty where the format names none

  friend bool operator==(const HeaderFact&, const HeaderFact&) = default;
};

/// Parses the whole stream as a file with `extension` (without the dot) and returns what its parser keeps of
/// the header. A file that is not valid has what was read before the fault; contents that cannot be followed,
/// and an unknown extension, have no facts.
std::vector<HeaderFact> HeaderFacts(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
