// The class object of every creatable class, and the form of it that a module keeps until it is unloaded.
#pragma once

#include <windows.h>

#include <mutex>
#include <utility>

#include "com_object.h"
#include "com_root.h"

namespace Qel::Com {

class CComClassFactory : public CComRoot<FreeThreaded, IClassFactory> {
 public:
  /// Creates the factory of the objects that `makeInstance` makes.
  explicit CComClassFactory(InstanceMaker makeInstance) : makeInstance_(makeInstance) {}

  /// Makes an object and queries it for `iid`. Returns E_POINTER for a null `object`, and
  /// CLASS_E_NOAGGREGATION if there is an outer object but `iid` is not IUnknown: the outer object needs the
  /// new object's own IUnknown first, because all its other interfaces delegate to the outer one.
  HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID iid, void** object) override;

  HRESULT STDMETHODCALLTYPE LockServer(BOOL lock) override;

 protected:
  ~CComClassFactory() = default;

 private:
  InstanceMaker makeInstance_;
};

/// An object to which the module itself keeps a reference. That first reference does not keep the module
/// loaded; every further one does.
template <class Class>
class CComObjectCached final : public Class {
 public:
  template <class... Arguments>
  explicit CComObjectCached(Arguments&&... arguments) : Class(std::forward<Arguments>(arguments)...) {}

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    return this->InternalQueryInterface(iid, object);
  }

  // The count and the module's lock change together: once one thread has raised the count to 2, no other
  // thread may obtain a reference before the module is locked.

  ULONG STDMETHODCALLTYPE AddRef() override {
    const std::lock_guard guard(this->section());
    const ULONG count = this->InternalAddRef();
    if (count == 2) Module::Current().Lock();
    return count;
  }

  ULONG STDMETHODCALLTYPE Release() override {
    const ULONG left = ReleaseUnderLock();
    if (left == 0) delete this;
    return left;
  }

 private:
  ULONG ReleaseUnderLock() {
    const std::lock_guard guard(this->section());
    const ULONG left = this->InternalRelease();
    if (left == 1) Module::Current().Unlock();
    return left;
  }
};

/// The signature of a function that makes the class object for `makeInstance`, with one reference.
using ClassObjectMaker = HRESULT (*)(InstanceMaker makeInstance, REFIID iid, void** classObject);

/// Makes a CComObjectCached<CComClassFactory> and queries it for `iid`. Returns the failure of either step.
HRESULT MakeClassFactory(InstanceMaker makeInstance, REFIID iid, void** classObject);

}  // namespace Qel::Com
