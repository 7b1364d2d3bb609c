// The module object of the DLL: the lock count that decides when the DLL may be unloaded, and the class
// objects of the object map, which are created on first request and kept until the DLL is unloaded.
#pragma once

#include <windows.h>

#include <atomic>
#include <span>
#include <vector>

#include "com_ptr.h"
#include "critical_section.h"
#include "module.h"
#include "object_map.h"
#include "registry_script.h"

class CQelShellExtModule : public Qel::Com::Module {
 public:
  using ObjectMapEntry = Qel::Lumetra::ShellExt::ObjectMapEntry;

  /// The identifier of the module's type library, which is never registered.
  static constexpr GUID kTypeLibraryId = {
      0x0506151B, 0x7799, 0x43EC, {0xB1, 0x47, 0x65, 0x85, 0x6D, 0xF0, 0x03, 0x0A}};

  /// Makes this the current module. `objectMap` must outlive it.
  explicit CQelShellExtModule(std::span<ObjectMapEntry> objectMap);

  /// Releases the class objects.
  ~CQelShellExtModule() override;

  LONG Lock() override { return ++lockCount_; }
  LONG Unlock() override { return --lockCount_; }
  LONG GetLockCount() const override { return lockCount_; }
  HRESULT GetGITPtr(IGlobalInterfaceTable** table) override;

  /// Adds the replacements that the scripts of the module and of all its classes use. A failure ends the
  /// registration.
  virtual HRESULT AddCommonRGSReplacements(
      std::vector<Qel::Lumetra::ShellExt::Replacement>& replacements) const;

  /// Returns whether a critical section could not be created. The DLL must not be loaded then.
  bool initFailed() const { return initFailed_; }

  /// Implements DllGetClassObject: returns the interface `iid` of the class object of `clsid`. Every caller
  /// gets the same class object. Threads may call this at the same time. Returns E_POINTER for a null
  /// `classObject`, E_UNEXPECTED if the lock of the object map could not be created,
  /// CLASS_E_CLASSNOTAVAILABLE for an unknown class, or the failure of the class object.
  HRESULT GetClassObject(REFCLSID clsid, REFIID iid, void** classObject);

 private:
  static HRESULT MakeClassObject(ObjectMapEntry& entry);

  std::atomic<LONG> lockCount_ = 0;
  std::span<ObjectMapEntry> objectMap_;
  Qel::Com::CriticalSection objectMapSection_;  // guards the creation of class objects
  bool isReady_;                                // whether class objects can be created
  Qel::Com::CriticalSection section_;           // guards the interface table
  bool initFailed_;
  Qel::Com::ComPtr<IGlobalInterfaceTable> interfaceTable_;
};
