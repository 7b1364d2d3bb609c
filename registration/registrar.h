// Runs a registry script (registry_script.h) in either direction, through a RegistryStore. The caller
// provides the script and its replacements.
//
// Registering creates every key of the script and sets its values; a key marked ForceRemove is first deleted
// with everything in it. It can be repeated, and completes an earlier attempt that failed halfway.
//
// Unregistering deletes the keys marked ForceRemove with all their contents, and every value set by `val`. A
// key without a mark is deleted if nothing is left in it but the default value that the script gave it; a key
// in which another program has stored something stays. A key marked NoRemove stays. Keys whose names many
// programs share (CLSID and others, see kSharedKeys) are never deleted, wherever they are: they count as
// NoRemove, whatever their mark.
//
// A string that is not a valid script is rejected before anything changes. Otherwise the first change that
// fails ends the run, and the changes before it remain.
#pragma once

#include <windows.h>

#include <span>
#include <string_view>

#include "registry_script.h"
#include "registry_store.h"

namespace Qel::Lumetra::ShellExt {

/// The result for a string that is not a valid script: HRESULT_FROM_WIN32(ERROR_INVALID_DATA).
inline constexpr HRESULT kInvalidScript = static_cast<HRESULT>(0x8007000D);

enum class ScriptDirection { kRegister, kUnregister };

/// Runs the script `text`. Returns S_OK, kInvalidScript, or the first failure of `store`.
HRESULT RunRegistryScript(std::string_view text, std::span<const Replacement> replacements,
                          ScriptDirection direction, RegistryStore& store);

}  // namespace Qel::Lumetra::ShellExt
