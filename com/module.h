// What the objects of this library need of the module that they live in: a count of the reasons to stay
// loaded. The server derives its module object from this and makes it current before the first object.
#pragma once

#include <windows.h>

#include <objidl.h>

namespace Qel::Com {

class Module {
 public:
  virtual ~Module() = default;
  Module(const Module&) = delete;
  Module& operator=(const Module&) = delete;

  /// One more and one less reason to stay loaded; both return the new count.
  virtual LONG Lock() = 0;
  virtual LONG Unlock() = 0;

  /// The module may be unloaded while this is 0.
  virtual LONG GetLockCount() const = 0;

  /// The process's global interface table, with a reference for the caller.
  virtual HRESULT GetGITPtr(IGlobalInterfaceTable** table) = 0;

  /// The one module of this DLL or program.
  static Module& Current();
  static void MakeCurrent(Module* module);

 protected:
  Module() = default;
};

/// Keeps the current module loaded as long as it lives.
class ModuleLock {
 public:
  ModuleLock() { Module::Current().Lock(); }
  ~ModuleLock() { Module::Current().Unlock(); }
  ModuleLock(const ModuleLock&) = delete;
  ModuleLock& operator=(const ModuleLock&) = delete;
};

}  // namespace Qel::Com
