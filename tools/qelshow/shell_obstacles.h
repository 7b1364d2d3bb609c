// The settings and policies of Windows that keep its shell from showing what the extension answers.
#pragma once

#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// Each names the most likely cause, to follow "the likely cause is".
std::wstring CauseOfNoThumbnail(const std::wstring& path);
std::wstring CauseOfAnotherThumbnail();
std::wstring CauseOfOtherProperties();

}  // namespace Qel::Lumetra::ShellExt::Show
