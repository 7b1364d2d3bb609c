// The class object of every creatable class, and the form in which a module keeps one for good.
#pragma once

#include <windows.h>

#include <mutex>
#include <utility>

#include "com_object.h"
#include "com_root.h"

namespace Qel::Com {

class CComClassFactory : public CComRoot<FreeThreaded, IClassFactory> {
 public:
  /// The factory of the objects that `makeInstance` makes.
  explicit CComClassFactory(InstanceMaker makeInstance) : makeInstance_(makeInstance) {}

  /// With an outer object only IUnknown may be asked for (CLASS_E_NOAGGREGATION), because any other
  /// interface of the new object would belong to the outer one.
  HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID iid, void** object) override;

  HRESULT STDMETHODCALLTYPE LockServer(BOOL lock) override;

 protected:
  ~CComClassFactory() = default;

 private:
  InstanceMaker makeInstance_;
};

/// An object that the module itself keeps a reference on. That first reference does not keep the module
/// loaded, every further one does.
template <class Class>
class CComObjectCached final : public Class {
 public:
  template <class... Arguments>
  explicit CComObjectCached(Arguments&&... arguments) : Class(std::forward<Arguments>(arguments)...) {}

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    return this->InternalQueryInterface(iid, object);
  }

  // The count and the module's lock change together: when one thread has raised the count to 2, another
  // must not come by a reference before the module is locked.

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

/// The signature of a class-object maker: the class object for `makeInstance`, with one reference.
using ClassObjectMaker = HRESULT (*)(InstanceMaker makeInstance, REFIID iid, void** classObject);

/// Makes a CComObjectCached<CComClassFactory>.
HRESULT MakeClassFactory(InstanceMaker makeInstance, REFIID iid, void** classObject);

}  // namespace Qel::Com
