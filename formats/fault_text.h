// Explains to users why a file has no thumbnail. The shell extension itself does not use this.
#pragma once

#include <istream>
#include <optional>
#include <string>

namespace Qel::Lumetra::ShellExt {

/// English text: what is wrong with a file, and what the user can do. Both are empty if nothing is wrong.
struct FaultText {
  std::string fault;
  std::string advice;
};

/// Parses the whole stream as a file with `extension` (without the dot). Returns the first fault that the
/// parser finds; nothing for an unknown extension.
std::optional<FaultText> ExplainFault(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
