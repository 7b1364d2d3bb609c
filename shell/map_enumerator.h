// The implementation that the enumerators of property sets and of properties share.
#pragma once

#include <windows.h>

#include <memory>
#include <utility>

#include "com_object.h"
#include "com_root.h"

namespace Qel::Lumetra::ShellExt {

/// Enumerates an ordered map. The enumerator shares the map with the object that created it, so the map stays
/// complete if that object is destroyed or loads another file. `Class` is the COM class that derives from
/// this; its static function Describe fills an `Element` from an entry of the map.
template <class Class, class Interface, class Element, class Map>
class MapEnumerator : public Com::CComRoot<Com::SingleThreaded, Interface> {
 public:
  explicit MapEnumerator(std::shared_ptr<const Map> map) : map_(std::move(map)), current_(map_->begin()) {}

  /// Makes an enumerator that starts at the beginning of `map`. Returns E_POINTER for a null `enumerator`, or
  /// the failure of MakeObject.
  static HRESULT Make(std::shared_ptr<const Map> map, Interface** enumerator) {
    if (enumerator == nullptr) return E_POINTER;
    *enumerator = nullptr;
    Com::ComPtr<Com::CComObject<Class>> made;
    const HRESULT result = Com::MakeObject(made, std::move(map));
    if (SUCCEEDED(result)) *enumerator = made.Detach();
    return result;
  }

  /// Writes up to `count` elements and their number; returns S_FALSE for fewer than `count`. `fetched` must
  /// not be null, whatever `count` is.
  HRESULT STDMETHODCALLTYPE Next(ULONG count, Element* elements, ULONG* fetched) override {
    *fetched = 0;
    if (elements == nullptr && count > 0 && current_ != map_->end()) return E_POINTER;
    for (; *fetched < count && current_ != map_->end(); ++current_) {
      Class::Describe(*current_, elements[*fetched]);
      ++*fetched;
    }
    return *fetched == count ? S_OK : S_FALSE;
  }

  /// Moves to the end and returns S_FALSE, even for a `count` smaller than the number of elements left.
  /// Intentional: clients rely on it. A `count` of 0 changes nothing.
  HRESULT STDMETHODCALLTYPE Skip(ULONG count) override {
    if (count == 0) return S_OK;
    current_ = map_->end();
    return S_FALSE;
  }

  HRESULT STDMETHODCALLTYPE Reset() override {
    current_ = map_->begin();
    return S_OK;
  }

  /// Makes an enumerator that starts at the beginning, not at this enumerator's position.
  HRESULT STDMETHODCALLTYPE Clone(Interface** enumerator) override { return Make(map_, enumerator); }

 protected:
  ~MapEnumerator() = default;

 private:
  std::shared_ptr<const Map> map_;
  typename Map::const_iterator current_;
};

}  // namespace Qel::Lumetra::ShellExt
