// One property set of a file, read-only and in memory. BuildPropertySets (property_sets.h) fills it once;
// from then on its values never change.
#pragma once

#include <windows.h>

#include <objidl.h>
#include <propidl.h>

#include <map>
#include <memory>

#include "com_root.h"

namespace Qel::Lumetra::ShellExt {

/// Owns one value.
class PropertyValue {
 public:
  PropertyValue() = default;
  ~PropertyValue() { PropVariantClear(&value_); }
  PropertyValue(const PropertyValue&) = delete;
  PropertyValue& operator=(const PropertyValue&) = delete;

  const PROPVARIANT& Get() const { return value_; }

  /// The place for a value; there must be none in it yet.
  PROPVARIANT& Put() { return value_; }

 private:
  PROPVARIANT value_{};
};

using PropertyMap = std::map<PROPID, PropertyValue>;

/// Refuses every change, and every question about names and statistics, with STG_E_ACCESSDENIED.
class CPropertyStorage : public Com::CComRoot<Com::SingleThreaded, IPropertyStorage> {
 public:
  /// Stores a copy of `value` as the property `id`, which must not be there yet.
  HRESULT Add(PROPID id, const PROPVARIANT& value);

  /// Copies one value for each specifier, which must be by id (STG_E_INVALIDPARAMETER); stops at the first
  /// property that is not there, with ERROR_NOT_SUPPORTED as an HRESULT and the values before it filled in.
  /// S_FALSE without specifiers.
  HRESULT STDMETHODCALLTYPE ReadMultiple(ULONG count, const PROPSPEC specifiers[],
                                         PROPVARIANT values[]) override;

  HRESULT STDMETHODCALLTYPE Enum(IEnumSTATPROPSTG** enumerator) override;

  HRESULT STDMETHODCALLTYPE WriteMultiple(ULONG, const PROPSPEC[], const PROPVARIANT[], PROPID) override {
    return STG_E_ACCESSDENIED;
  }
  HRESULT STDMETHODCALLTYPE DeleteMultiple(ULONG, const PROPSPEC[]) override { return STG_E_ACCESSDENIED; }
  HRESULT STDMETHODCALLTYPE ReadPropertyNames(ULONG, const PROPID[], LPOLESTR[]) override {
    return STG_E_ACCESSDENIED;
  }
  HRESULT STDMETHODCALLTYPE WritePropertyNames(ULONG, const PROPID[], const LPOLESTR[]) override {
    return STG_E_ACCESSDENIED;
  }
  HRESULT STDMETHODCALLTYPE DeletePropertyNames(ULONG, const PROPID[]) override { return STG_E_ACCESSDENIED; }
  HRESULT STDMETHODCALLTYPE Commit(DWORD) override { return STG_E_ACCESSDENIED; }
  HRESULT STDMETHODCALLTYPE Revert() override { return STG_E_ACCESSDENIED; }
  HRESULT STDMETHODCALLTYPE SetTimes(const FILETIME*, const FILETIME*, const FILETIME*) override {
    return STG_E_ACCESSDENIED;
  }
  HRESULT STDMETHODCALLTYPE SetClass(REFCLSID) override { return STG_E_ACCESSDENIED; }
  HRESULT STDMETHODCALLTYPE Stat(STATPROPSETSTG*) override { return STG_E_ACCESSDENIED; }

 protected:
  ~CPropertyStorage() = default;

 private:
  std::shared_ptr<PropertyMap> properties_ = std::make_shared<PropertyMap>();  // with the enumerators
};

}  // namespace Qel::Lumetra::ShellExt
