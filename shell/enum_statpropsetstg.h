// The enumerator of the property sets of a file.
#pragma once

#include "map_enumerator.h"
#include "property_sets.h"

namespace Qel::Lumetra::ShellExt {

/// Enumerates format identifiers in ascending order (FormatIdLess). The sets have no class, flags or times.
class CEnumSTATPROPSETSTG
    : public MapEnumerator<CEnumSTATPROPSETSTG, IEnumSTATPROPSETSTG, STATPROPSETSTG, PropertySets> {
 public:
  using MapEnumerator::MapEnumerator;

  static void Describe(const PropertySets::value_type& set, STATPROPSETSTG& element) {
    element.fmtid = set.first;
    element.clsid = {};
    element.grfFlags = 0;
    element.mtime = {};
    element.ctime = {};
    element.atime = {};
    // The caller presets dwOSVersion, so it is not written.
  }

 protected:
  ~CEnumSTATPROPSETSTG() = default;
};

}  // namespace Qel::Lumetra::ShellExt
