// The expected contents of the machine's registry.
#pragma once

#include <string>

#include "registry_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {

/// Returns what an empty registry, whose HKCR is HKLM\Software\Classes, contains after the DLL at `path` is
/// registered.
RegistryContents ExpectedAfterRegistering(const std::wstring& path);

/// Returns what it contains after the DLL has been unregistered again.
RegistryContents ExpectedAfterUnregistering();

}  // namespace Qel::Lumetra::ShellExt::Testing
