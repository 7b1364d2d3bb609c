// What the machine's registry holds of the server, as tables.
#pragma once

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Everything that registering the DLL at `path` makes of an empty registry whose HKCR is
/// HKLM\Software\Classes.
RegistryContents ExpectedAfterRegistering(const std::wstring& path);

/// What is left of it after unregistering.
RegistryContents ExpectedAfterUnregistering();

}  // namespace Qel::Lumetra::ShellExt::Testing
