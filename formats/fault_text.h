// Why a file has no picture, in words for its user. The shell extension itself does not use this.
#pragma once

#include <istream>
#include <optional>
#include <string>

namespace Qel::Lumetra::ShellExt {

/// Parses the whole stream as a file with `extension` (without the dot) and returns a sentence in English
/// about what is wrong, as far as the parser can tell; an empty text if nothing is, and none for an unknown
/// extension.
std::optional<std::string> FaultText(std::istream& stream, const std::wstring& extension);

}  // namespace Qel::Lumetra::ShellExt
