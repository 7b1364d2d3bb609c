// The base of every COM class. A class derives from CComRoot with its threading model and its interfaces,
// and that list is its interface map:
//
//   class CShape : public CComRoot<SingleThreaded, IDraw, IPersistStream> { ... };
//
// What is missing in such a class, the three methods of IUnknown, comes from the templates of
// com_object.h, which decide whether an object stands alone or is part of another.
#pragma once

#include <windows.h>

#include <unknwn.h>

#include "threading.h"

namespace Qel::Com {

/// The identifier of an interface. To be specialised where the platform's headers attach none to the type.
template <class Interface>
inline constexpr IID kInterfaceId = __uuidof(Interface);

/// Objects answer IUnknown with their first interface, each interface that is listed, and no other: a base
/// of a listed interface, such as IPersist of IPersistFile, has to be listed to be answered.
/// The interfaces lie in the object in the order of the list, before every other member.
template <class Threading, class Primary, class... Others>
class CComRoot : public Primary, public Others... {
 public:
  using ThreadingModel = Threading;

  CComRoot(const CComRoot&) = delete;
  CComRoot& operator=(const CComRoot&) = delete;

  /// The part of creation that can fail, for a class to hide with its own. It runs after the constructor,
  /// when references may be taken; a failure destroys the object.
  HRESULT FinalConstruct() { return S_OK; }

  // One IUnknown for all the interfaces; com_object.h says what it does.
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override = 0;
  ULONG STDMETHODCALLTYPE AddRef() override = 0;
  ULONG STDMETHODCALLTYPE Release() override = 0;

  // The rest is for the templates of com_object.h and class_factory.h.

  HRESULT CreateSection() { return section_.Create(); }

  ULONG InternalAddRef() { return ++count_; }
  ULONG InternalRelease() { return --count_; }

  /// Looks `iid` up in the list. On success the caller has a reference, by the object's own AddRef.
  HRESULT InternalQueryInterface(REFIID iid, void** object) {
    if (object == nullptr) return E_POINTER;
    *object = nullptr;
    if (iid == kInterfaceId<IUnknown>) {
      *object = static_cast<Primary*>(this);
    } else {
      const bool found = Answer<Primary>(iid, object) || (... || Answer<Others>(iid, object));
      if (!found) return E_NOINTERFACE;
    }
    AddRef();
    return S_OK;
  }

 protected:
  CComRoot() = default;
  ~CComRoot() = default;

  /// The object's own lock, which does nothing for SingleThreaded.
  typename Threading::Section& section() { return section_; }

 private:
  template <class Interface>
  bool Answer(REFIID iid, void** object) {
    if (iid != kInterfaceId<Interface>) return false;
    *object = static_cast<Interface*>(this);
    return true;
  }

  typename Threading::Count count_{0};
  [[no_unique_address]] typename Threading::Section section_;
};

}  // namespace Qel::Com
