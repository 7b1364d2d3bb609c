// The enumerator of the properties of one set.
#pragma once

#include "map_enumerator.h"
#include "property_storage.h"

namespace Qel::Lumetra::ShellExt {

/// Enumerates property identifiers with their types, in ascending order. The properties have no names here.
class CEnumSTATPROPSTG : public MapEnumerator<CEnumSTATPROPSTG, IEnumSTATPROPSTG, STATPROPSTG, PropertyMap> {
 public:
  using MapEnumerator::MapEnumerator;

  static void Describe(const PropertyMap::value_type& property, STATPROPSTG& element) {
    element = {.lpwstrName = nullptr, .propid = property.first, .vt = property.second.Get().vt};
  }

 protected:
  ~CEnumSTATPROPSTG() = default;
};

}  // namespace Qel::Lumetra::ShellExt
