#include "property_storage.h"

#include "enum_statpropstg.h"

namespace Qel::Lumetra::ShellExt {

HRESULT CPropertyStorage::Add(PROPID id, const PROPVARIANT& value) {
  return PropVariantCopy(&(*properties_)[id].Put(), &value);
}

HRESULT CPropertyStorage::ReadMultiple(ULONG count, const PROPSPEC specifiers[], PROPVARIANT values[]) {
  if (specifiers == nullptr && count > 0) return E_POINTER;
  HRESULT result = S_FALSE;
  for (ULONG i = 0; i < count; ++i) {
    if (specifiers[i].ulKind != PRSPEC_PROPID) return STG_E_INVALIDPARAMETER;
    const auto property = properties_->find(specifiers[i].propid);
    if (property == properties_->end()) return HRESULT_FROM_WIN32(ERROR_NOT_SUPPORTED);
    if (values == nullptr) return E_POINTER;
    result = PropVariantCopy(&values[i], &property->second.Get());
    if (FAILED(result)) return result;
  }
  return result;
}

HRESULT CPropertyStorage::Enum(IEnumSTATPROPSTG** enumerator) {
  return CEnumSTATPROPSTG::Make(properties_, enumerator);
}

}  // namespace Qel::Lumetra::ShellExt
