// The table of the creatable classes, which both class objects and registration use. An entry has no fields
// for a description, component categories or initialisation at load time, because no class needs them.
#pragma once

#include <windows.h>

#include <atomic>
#include <span>

#include "class_factory.h"

namespace Qel::Lumetra::ShellExt {

/// An entry without `clsid` is empty: GetClassObject skips it, but registration still runs its script.
struct ObjectMapEntry {
  const CLSID* clsid = nullptr;
  UINT registryScript = 0;  ///< resource identifier (script_ids.h) of the class's registry script
  Com::ClassObjectMaker makeClassObject = nullptr;
  Com::InstanceMaker makeInstance = nullptr;

  /// The class object, null until it is first requested, with one reference that the module holds.
  /// EncodePointer obfuscates it, so that a stray write cannot make it point to code of an attacker's choice.
  std::atomic<void*> classObject = nullptr;
};

/// Returns the classes of this server in the order of registration.
std::span<ObjectMapEntry> ObjectMap();

}  // namespace Qel::Lumetra::ShellExt
