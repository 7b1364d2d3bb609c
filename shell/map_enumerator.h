// The common body of the enumerators of property sets and of properties.
#pragma once

#include <windows.h>

#include <memory>
#include <utility>

#include "com_object.h"
#include "com_root.h"

namespace Qel::Lumetra::ShellExt {

/// Walks an ordered map that is shared with the object that made the enumerator, so that it stays whole when
/// that object goes or turns to another file. `Class` is the COM class that derives from this; its static
/// function Describe fills an `Element` from an entry of the map.
template <class Class, class Interface, class Element, class Map>
class MapEnumerator : public Com::CComRoot<Com::SingleThreaded, Interface> {
 public:
  explicit MapEnumerator(std::shared_ptr<const Map> map) : map_(std::move(map)), current_(map_->begin()) {}

  /// A new enumerator at the beginning of `map`.
  static HRESULT Make(std::shared_ptr<const Map> map, Interface** enumerator) {
    if (enumerator == nullptr) return E_POINTER;
    *enumerator = nullptr;
    Com::ComPtr<Com::CComObject<Class>> made;
    const HRESULT result = Com::MakeObject(made, std::move(map));
    if (SUCCEEDED(result)) *enumerator = made.Detach();
    return result;
  }

  /// `fetched` must not be null, however few elements are asked for: the count is always written.
  HRESULT STDMETHODCALLTYPE Next(ULONG count, Element* elements, ULONG* fetched) override {
    *fetched = 0;
    if (elements == nullptr && count > 0 && current_ != map_->end()) return E_POINTER;
    for (; *fetched < count && current_ != map_->end(); ++current_) {
      Class::Describe(*current_, elements[*fetched]);
      ++*fetched;
    }
    return *fetched == count ? S_OK : S_FALSE;
  }

  /// Goes to the end, however few elements are to be skipped. Clients count on it.
  HRESULT STDMETHODCALLTYPE Skip(ULONG count) override {
    if (count == 0) return S_OK;
    current_ = map_->end();
    return S_FALSE;
  }

  HRESULT STDMETHODCALLTYPE Reset() override {
    current_ = map_->begin();
    return S_OK;
  }

  /// The clone stands at the beginning, not where this enumerator stands.
  HRESULT STDMETHODCALLTYPE Clone(Interface** enumerator) override { return Make(map_, enumerator); }

 protected:
  ~MapEnumerator() = default;

 private:
  std::shared_ptr<const Map> map_;
  typename Map::const_iterator current_;
};

}  // namespace Qel::Lumetra::ShellExt
