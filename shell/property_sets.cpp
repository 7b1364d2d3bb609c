#include "property_sets.h"

#include <algorithm>
#include <tuple>

#include "com_object.h"
#include "property_storage.h"
#include "property_table.h"

namespace Qel::Lumetra::ShellExt {
namespace {

HRESULT AddPropertySet(const FileTypeInfo& reader, const FMTID& set, PropertySets& sets) {
  Com::ComPtr<Com::CComObject<CPropertyStorage>> storage;
  HRESULT result = Com::MakeObject(storage);
  if (FAILED(result)) return result;
  for (const Property& property : kProperties) {
    if (property.key.fmtid != set) continue;
    PropertyValue value;
    // Enumerators of these sets have always reported VT_INT as the type of numbers.
    result = ToAutomationValue(property.value(reader), VT_INT, value.Put());
    if (SUCCEEDED(result)) result = storage->Add(property.key.pid, value.Get());
    if (FAILED(result)) return result;
  }
  sets.emplace(set, storage.Get());
  return S_OK;
}

}  // namespace

bool FormatIdLess::operator()(const FMTID& a, const FMTID& b) const {
  const auto fields = [](const FMTID& id) { return std::tie(id.Data1, id.Data2, id.Data3); };
  if (fields(a) != fields(b)) return fields(a) < fields(b);
  return std::ranges::lexicographical_compare(a.Data4, b.Data4);
}

HRESULT BuildPropertySets(const FileTypeInfo& reader, std::shared_ptr<const PropertySets>& sets) {
  const auto built = std::make_shared<PropertySets>();
  for (const FMTID& set : {kSummarySet, kImageSummarySet}) {
    if (const HRESULT result = AddPropertySet(reader, set, *built); FAILED(result)) return result;
  }
  sets = built;
  return S_OK;
}

}  // namespace Qel::Lumetra::ShellExt
