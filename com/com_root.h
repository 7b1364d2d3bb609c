// The base of every COM class. A class derives from CComRoot with its threading model and its interfaces, and
// that list is its interface map:
//
//   class CShape : public CComRoot<SingleThreaded, IDraw, IPersistStream> { ... };
//
// Such a class lacks the three methods of IUnknown. The templates of com_object.h add them, for standalone
// and for aggregated objects.
#pragma once

#include <windows.h>

#include <unknwn.h>

#include "threading.h"

namespace Qel::Com {

/// The identifier of an interface. Specialise it where the platform's headers attach none to the type.
template <class Interface>
inline constexpr IID kInterfaceId = __uuidof(Interface);

/// QueryInterface finds IUnknown, for which it returns the first interface, and every interface in the list.
/// It finds no other: a base of a listed interface, such as IPersist of IPersistFile, must itself be listed.
/// The interfaces are laid out in the object in the order of the list, before every other member.
template <class Threading, class Primary, class... Others>
class CComRoot : public Primary, public Others... {
 public:
  using ThreadingModel = Threading;

  CComRoot(const CComRoot&) = delete;
  CComRoot& operator=(const CComRoot&) = delete;

  /// The part of construction that can fail. A class that has such a part hides this function with its own.
  /// It runs after the constructor, when references may be taken; a failure destroys the object.
  HRESULT FinalConstruct() { return S_OK; }

  // All interfaces share one IUnknown, which com_object.h implements.
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override = 0;
  ULONG STDMETHODCALLTYPE AddRef() override = 0;
  ULONG STDMETHODCALLTYPE Release() override = 0;

  // The following functions are for the templates of com_object.h and class_factory.h.

  HRESULT CreateSection() { return section_.Create(); }

  ULONG InternalAddRef() { return ++count_; }
  ULONG InternalRelease() { return --count_; }

  /// Finds `iid` in the list and adds a reference with the object's own AddRef. Returns E_NOINTERFACE for an
  /// interface that is not in the list and E_POINTER for a null `object`.
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

  /// Returns the object's lock, which does nothing for SingleThreaded.
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
