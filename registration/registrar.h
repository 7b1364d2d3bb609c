// Runs a registry script (registry_script.h) in either direction, through a RegistryStore. The caller finds
// the script and its replacements.
//
// Registering makes every key of the script, a key marked ForceRemove anew and empty, and sets what the
// script says. It can be repeated, and completes what an earlier attempt left half done.
//
// Unregistering deletes the keys marked ForceRemove with all they hold and every value set by `val`. A key
// without a mark goes when nothing is left in it but the default value that the script gave it: values
// of others keep it alive. A key marked NoRemove stays. Keys whose names many programs share (CLSID and the
// like, see kSharedKeys) are never deleted, whatever their mark and wherever they are: with a mark that
// would delete them, they count as NoRemove.
//
// A text that is no script is refused before anything is changed; otherwise the first change that fails ends
// the run, and what was done before it stays.
#pragma once

#include <windows.h>

#include <span>
#include <string_view>

#include "registry_script.h"
#include "registry_store.h"

namespace Qel::Lumetra::ShellExt {

/// What a text is refused with that is no script: HRESULT_FROM_WIN32(ERROR_INVALID_DATA).
inline constexpr HRESULT kInvalidScript = static_cast<HRESULT>(0x8007000D);

enum class ScriptDirection { kRegister, kUnregister };

/// S_OK, kInvalidScript, or the first failure of `store`.
HRESULT RunRegistryScript(std::string_view text, std::span<const Replacement> replacements,
                          ScriptDirection direction, RegistryStore& store);

}  // namespace Qel::Lumetra::ShellExt
