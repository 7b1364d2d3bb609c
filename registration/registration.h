// What DllRegisterServer and DllUnregisterServer do: the registry scripts of the module, which are its
// resources of type "REGISTRY", run in order and surrounded by what the shell and the thread need.
//
// The module and its classes come as arguments, so that nothing here knows a class. Type libraries and
// component categories are not registered: the classes have none.
#pragma once

#include <windows.h>

#include <span>

#include "registry_script.h"

namespace Qel::Lumetra::ShellExt {

struct ServerRegistration {
  /// Its resources hold the scripts, and its path replaces %MODULE% (with every quote doubled, as the
  /// scripts have it in quotes) and %MODULE_RAW% (as it is).
  HINSTANCE module = nullptr;

  /// What else the scripts may refer to; takes precedence over the two above.
  std::span<const Replacement> replacements;

  /// The scripts of the classes, in the order of the object map. The script of the module itself, 101, is
  /// not among them.
  std::span<const UINT> classScripts;
};

/// Runs the module's own script, then those of the classes, and tells the shell when all have succeeded.
/// Otherwise returns the first failure, leaving what was written before it: E_OUTOFMEMORY, that of a script
/// that cannot be found, kInvalidScript, a registry error, or ERROR_INSUFFICIENT_BUFFER as an HRESULT for
/// a module whose path does not fit into 260 characters with its terminator, in which case nothing is
/// written. The thread's locale is LOCALE_SYSTEM_DEFAULT meanwhile, and restored on every path.
HRESULT RegisterServer(const ServerRegistration& server);

/// The same, with the scripts run for unregistration and the module's own script last.
HRESULT UnregisterServer(const ServerRegistration& server);

}  // namespace Qel::Lumetra::ShellExt
