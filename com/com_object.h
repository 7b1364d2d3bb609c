// Objects of COM classes: standalone (CComObject) or aggregated (a CComAggObject around a
// CComContainedObject), and the functions that make them for class factories and for the classes themselves.
//
// Both kinds keep the module loaded while they exist, even if another object of the module made them and they
// outlive it: code must not be unloaded while a client can still call it.
#pragma once

#include <windows.h>

#include <memory>
#include <new>
#include <utility>

#include "com_ptr.h"
#include "com_root.h"
#include "module.h"

namespace Qel::Com {

/// A standalone object of `Class`.
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
      // moduleLock_ is destroyed before the base class, whose destructor needs the module too.
      const ModuleLock untilDeleted;
      delete this;
    }
    return left;
  }

 private:
  ModuleLock moduleLock_;
};

/// The object of `Class` inside a CComAggObject. Its IUnknown is the outer object's.
template <class Class>
class CComContainedObject final : public Class {
 public:
  /// Takes no reference to `outer`, because `outer` owns this object.
  explicit CComContainedObject(IUnknown* outer) : outer_(outer) {}

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    return outer_->QueryInterface(iid, object);
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return outer_->AddRef(); }
  ULONG STDMETHODCALLTYPE Release() override { return outer_->Release(); }

 private:
  IUnknown* outer_;
};

/// The inner object of an aggregate. Its own IUnknown, which the outer object holds, counts the references
/// and finds the interfaces of `Class`; those interfaces delegate their IUnknown to the outer object.
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
      // moduleLock_ is destroyed before contained_, whose destructor needs the module too.
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

/// Makes an `Object` (one of the templates above or CComObjectCached) from the constructor's `arguments`,
/// with one reference, which `made` holds. Returns E_OUTOFMEMORY if there is no memory for the object or for
/// what its constructor allocates. If creating the object's lock or its final construction fails, destroys
/// the object and returns that failure.
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

/// Makes an `Object` and queries it for `iid`. Returns the failure of either step.
template <class Object, class... Arguments>
HRESULT MakeObjectAs(REFIID iid, void** answer, Arguments&&... arguments) {
  ComPtr<Object> object;
  const HRESULT result = MakeObject(object, std::forward<Arguments>(arguments)...);
  return SUCCEEDED(result) ? object->QueryInterface(iid, answer) : result;
}

/// The signature of a function that makes an object and queries it for `iid`. The object is aggregated by
/// `outer` unless that is null.
using InstanceMaker = HRESULT (*)(IUnknown* outer, REFIID iid, void** object);

/// Makes an instance of `Class`. Returns E_POINTER for a null `object`; on any other failure `*object` is
/// null.
template <class Class>
HRESULT MakeInstance(IUnknown* outer, REFIID iid, void** object) {
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  return outer == nullptr ? MakeObjectAs<CComObject<Class>>(iid, object)
                          : MakeObjectAs<CComAggObject<Class>>(iid, object, outer);
}

}  // namespace Qel::Com
