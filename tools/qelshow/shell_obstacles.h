// Finds what prevents the Windows shell from showing what the extension returns: settings, policies, and the
// state of a file. The doctor reports each setting, and the comparison with the shell (shell_view.h) the
// likely cause of a difference.
#pragma once

#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Show {

/// Returns a sentence for each setting and policy that hides thumbnails, with what to do about it.
std::vector<std::wstring> FindSettingsThatHideThumbnails();

/// Return a sentence with the likely cause and what to do about it.
std::wstring CauseOfNoThumbnail(const std::wstring& path);
std::wstring CauseOfAnotherThumbnail();
std::wstring CauseOfOtherProperties();

}  // namespace Qel::Lumetra::ShellExt::Show
