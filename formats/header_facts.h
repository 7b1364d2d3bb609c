// The values of a header that do not describe the frame, for programs that show them to users. The shell
// extension itself does not use this.
#pragma once

#include <cstdint>
#include <istream>
#include <string>
#include <variant>
#include <vector>

namespace Qel::Lumetra::ShellExt {

struct HeaderFact {
  std::string name;                                       // in English
  std::variant<std::int64_t, double, std::string> value;  // a string has the bytes of the file
  std::string unit{};  // may be a string of the file; empty if the format defines none

  friend bool operator==(const HeaderFact&, const HeaderFact&) = default;
};

/// Parses the whole stream as a file with `extension` (without the dot) and returns the values of its header.
/// For a file that is not valid, returns the values that precede the fault. Returns nothing for contents that
/// make the parser throw, and for an unknown extension.
std::vector<HeaderFact> HeaderFacts(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
