// Implements DllRegisterServer and DllUnregisterServer, which run the registry scripts (resources of type
// "REGISTRY") in order. No type libraries or component categories are registered, because the classes have
// none.
#pragma once

#include <windows.h>

#include <span>

#include "object_map.h"
#include "qel_shell_ext_module.h"
#include "registrar.h"

namespace Qel::Lumetra::ShellExt {

/// Runs the scripts of the module and of the classes, the latter in the order of `objectMap`, and then
/// notifies the shell. The module's script is the first to register and the last to unregister.
///
/// The scripts are resources of `instance`. Its path replaces %MODULE% (with every quote doubled, because the
/// scripts put it into quotes) and %MODULE_RAW% (unchanged); `module` adds the other replacements.
///
/// Returns the first failure: E_OUTOFMEMORY, the error of a script that cannot be found, kInvalidScript, a
/// registry error, or ERROR_INSUFFICIENT_BUFFER as an HRESULT if the path and its terminator do not fit into
/// 260 characters, in which case nothing is written. After any other failure, the changes before it remain
/// and the shell is not notified. During the call the thread's locale is LOCALE_SYSTEM_DEFAULT; the previous
/// locale is always restored.
HRESULT UpdateRegistration(ScriptDirection direction, HINSTANCE instance, const CQelShellExtModule& module,
                           std::span<const ObjectMapEntry> objectMap);

}  // namespace Qel::Lumetra::ShellExt
