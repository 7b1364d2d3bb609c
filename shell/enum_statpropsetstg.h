// The enumerator of the property sets of a file.
#pragma once

#include "map_enumerator.h"
#include "property_sets.h"

namespace Qel::Lumetra::ShellExt {

/// Format ids in ascending order (FormatIdLess); the sets know no class, flags or times.
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
    // The system's version is the caller's to preset: it is not written.
  }

 protected:
  ~CEnumSTATPROPSETSTG() = default;
};

}  // namespace Qel::Lumetra::ShellExt
