// What DllRegisterServer and DllUnregisterServer do: the registry scripts, which are resources of type
// "REGISTRY", run in order and surrounded by what the shell and the thread need. Type libraries and component
// categories are not registered: the classes have none.
#pragma once

#include <windows.h>

#include <span>

#include "object_map.h"
#include "qel_shell_ext_module.h"
#include "registrar.h"

namespace Qel::Lumetra::ShellExt {

/// Runs the module's own script and those of the classes in the order of `objectMap`, the module's own first
/// to register and last to unregister, and then notifies the shell.
///
/// The resources of `instance` hold the scripts. Its path replaces %MODULE% (with every quote doubled, as the
/// scripts have it in quotes) and %MODULE_RAW% (as it is); `module` adds the other replacements.
///
/// Returns the first failure, leaving what was written before it and without a notification: E_OUTOFMEMORY,
/// that of a script that cannot be found, kInvalidScript, a registry error, or ERROR_INSUFFICIENT_BUFFER as
/// an HRESULT for a path that does not fit into 260 characters with its terminator, in which case nothing is
/// written. The thread's locale is LOCALE_SYSTEM_DEFAULT meanwhile, and restored on every path.
HRESULT UpdateRegistration(ScriptDirection direction, HINSTANCE instance, const CQelShellExtModule& module,
                           std::span<const ObjectMapEntry> objectMap);

}  // namespace Qel::Lumetra::ShellExt
