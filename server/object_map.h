// The table of the creatable classes, which every walk over the classes follows: class objects and
// registration. The classes have neither a description nor component categories, and nothing to do when the
// module is loaded, so an entry has no place for that.
#pragma once

#include <windows.h>

#include <atomic>
#include <span>

#include "class_factory.h"

namespace Qel::Lumetra::ShellExt {

struct ObjectMapEntry {
  const CLSID* clsid = nullptr;  ///< null in an empty entry
  UINT registryScript = 0;       ///< resource id of the script that registers the class (script_ids.h)
  Com::ClassObjectMaker makeClassObject = nullptr;
  Com::InstanceMaker makeInstance = nullptr;

  /// The class object once it has been asked for, as EncodePointer stores it, so that a stray write cannot
  /// make it point to code of its choice. The module holds one reference on it.
  std::atomic<void*> classObject = nullptr;
};

/// The map of this server, in the order of registration.
std::span<ObjectMapEntry> ObjectMap();

}  // namespace Qel::Lumetra::ShellExt
