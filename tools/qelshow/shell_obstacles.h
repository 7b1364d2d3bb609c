// Finds what prevents the Windows shell from showing what the extension returns: settings, policies, and the
// state of a file. The doctor names each setting; a comparison with the shell (shell_view.h) names the likely
// cause.
#pragma once

#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// Returns a sentence for each setting and policy that hides thumbnails, with what to do about it.
std::vector<std::wstring> FindSettingsThatHideThumbnails();

/// Return the most likely cause, in words that complete a sentence after "the likely cause is".
std::wstring CauseOfNoThumbnail(const std::wstring& path);
std::wstring CauseOfAnotherThumbnail();
std::wstring CauseOfOtherProperties();

}  // namespace Qel::Lumetra::ShellExt::Show
