// The services that the objects of this library need from their module, above all a count of the reasons to
// stay loaded. The server derives its module object from Module and makes it current before it creates the
// first object.
#pragma once

#include <windows.h>

#include <objidl.h>

namespace Qel::Com {

class Module {
 public:
  virtual ~Module() = default;
  Module(const Module&) = delete;
  Module& operator=(const Module&) = delete;

  /// Add and remove one reason to stay loaded. Both return the new count.
  virtual LONG Lock() = 0;
  virtual LONG Unlock() = 0;

  /// Returns the count. The module may be unloaded while it is 0.
  virtual LONG GetLockCount() const = 0;

  /// Returns the process's global interface table, with a reference for the caller.
  virtual HRESULT GetGITPtr(IGlobalInterfaceTable** table) = 0;

  /// Returns the module of this DLL or program.
  static Module& Current();
  static void MakeCurrent(Module* module);

 protected:
  Module() = default;
};

/// Keeps the current module loaded for its own lifetime.
class ModuleLock {
 public:
  ModuleLock() { Module::Current().Lock(); }
  ~ModuleLock() { Module::Current().Unlock(); }
  ModuleLock(const ModuleLock&) = delete;
  ModuleLock& operator=(const ModuleLock&) = delete;
};

}  // namespace Qel::Com
