// How an object of a COM class comes to be: alone (CComObject), as part of another object (CComAggObject
// around a CComContainedObject), and the makers that class factories and the classes themselves call.
//
// Both kinds keep the module loaded as long as they live, also when they are made by another object of the
// module and outlive it: code must not be unloaded while a client can still call into it.
#pragma once

#include <windows.h>

#include <memory>
#include <new>
#include <utility>

#include "com_ptr.h"
#include "com_root.h"
#include "module.h"

namespace Qel::Com {

/// An object of `Class` that stands alone.
template <class Class>
class CComObject final : public Class {
 public:
  template <class... Arguments>
  explicit CComObject(Arguments&&... arguments) : Class(std::forward<Arguments>(arguments)...) {}

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    return this->InternalQueryInterface(iid, object);
  }

  ULONG STDMETHODCALLTYPE AddRef() override { return this->InternalAddRef(); }

  ULONG STDMETHODCALLTYPE Release() override {
    const ULONG left = this->InternalRelease();
    if (left == 0) {
      const ModuleLock untilDeleted;
      delete this;
    }
    return left;
  }

 private:
  ModuleLock moduleLock_;
};

/// An object of `Class` inside of a CComAggObject: its IUnknown is the outer object's.
template <class Class>
class CComContainedObject final : public Class {
 public:
  /// `outer` owns this object, so that no reference is taken on it.
  explicit CComContainedObject(IUnknown* outer) : outer_(outer) {}

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    return outer_->QueryInterface(iid, object);
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return outer_->AddRef(); }
  ULONG STDMETHODCALLTYPE Release() override { return outer_->Release(); }

 private:
  IUnknown* outer_;
};

/// The inner half of an aggregate. Its own IUnknown, which the outer object holds, counts its life and
/// finds the interfaces of `Class`; those interfaces belong to the outer object.
template <class Class>
class CComAggObject final : public IUnknown {
 public:
  explicit CComAggObject(IUnknown* outer) : contained_(outer) {}
  CComAggObject(const CComAggObject&) = delete;
  CComAggObject& operator=(const CComAggObject&) = delete;

  HRESULT CreateSection() { return contained_.CreateSection(); }
  HRESULT FinalConstruct() { return contained_.FinalConstruct(); }

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    if (iid != kInterfaceId<IUnknown>) return contained_.InternalQueryInterface(iid, object);
    if (object == nullptr) return E_POINTER;
    *object = static_cast<IUnknown*>(this);
    AddRef();
    return S_OK;
  }

  ULONG STDMETHODCALLTYPE AddRef() override { return ++count_; }

  ULONG STDMETHODCALLTYPE Release() override {
    const ULONG left = --count_;
    if (left == 0) {
      const ModuleLock untilDeleted;
      delete this;
    }
    return left;
  }

 private:
  typename Class::ThreadingModel::Count count_{0};
  CComContainedObject<Class> contained_;
  ModuleLock moduleLock_;
};

/// Makes an `Object` (one of the templates above or CComObjectCached) with the constructor's `arguments`
/// and one reference, held by `made`. Without memory for the object or for what its constructor needs
/// E_OUTOFMEMORY; when the object's lock or its final construction fails, that failure, and the object is
/// destroyed.
template <class Object, class... Arguments>
HRESULT MakeObject(ComPtr<Object>& made, Arguments&&... arguments) {
  std::unique_ptr<Object> unreferenced;
  try {
    unreferenced = std::make_unique<Object>(std::forward<Arguments>(arguments)...);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  HRESULT result = unreferenced->CreateSection();
  if (FAILED(result)) return result;
  ComPtr<Object> object(unreferenced.release());
  result = object->FinalConstruct();
  if (SUCCEEDED(result)) made = std::move(object);
  return result;
}

/// Makes an `Object` and asks it for the interface `iid`.
template <class Object, class... Arguments>
HRESULT MakeObjectAs(REFIID iid, void** answer, Arguments&&... arguments) {
  ComPtr<Object> object;
  const HRESULT result = MakeObject(object, std::forward<Arguments>(arguments)...);
  return SUCCEEDED(result) ? object->QueryInterface(iid, answer) : result;
}

/// The signature of an instance maker: an object for the interface `iid`, aggregated by `outer` if that is
/// not null.
using InstanceMaker = HRESULT (*)(IUnknown* outer, REFIID iid, void** object);

/// The instance maker of `Class`. A null `object` is E_POINTER; otherwise it is null after a failure.
template <class Class>
HRESULT MakeInstance(IUnknown* outer, REFIID iid, void** object) {
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  return outer == nullptr ? MakeObjectAs<CComObject<Class>>(iid, object)
                          : MakeObjectAs<CComAggObject<Class>>(iid, object, outer);
}

}  // namespace Qel::Com
