// A read-only property set of a file, in memory. BuildPropertySets (property_sets.h) fills it once; after
// that its values never change.
#pragma once

#include <windows.h>

#include <objidl.h>
#include <propidl.h>

#include <map>
#include <memory>

#include "com_root.h"

namespace Qel::Lumetra::ShellExt {

/// Owns one PROPVARIANT.
class PropertyValue {
 public:
  PropertyValue() = default;
  ~PropertyValue() { PropVariantClear(&value_); }
  PropertyValue(const PropertyValue&) = delete;
  PropertyValue& operator=(const PropertyValue&) = delete;

  const PROPVARIANT& Get() const { return value_; }

  /// Returns the place to store a value. It must not hold one yet.
  PROPVARIANT& Put() { return value_; }

 private:
  PROPVARIANT value_{};
};

using PropertyMap = std::map<PROPID, PropertyValue>;

/// A read-only property set. Every change, and every query of names or statistics, returns
/// STG_E_ACCESSDENIED.
class CPropertyStorage : public Com::CComRoot<Com::SingleThreaded, IPropertyStorage> {
 public:
  /// Stores a copy of `value` as the property `id`, which must not exist yet. Returns the result of
  /// PropVariantCopy.
  HRESULT Add(PROPID id, const PROPVARIANT& value);

  /// Copies one value for each specifier. Returns STG_E_INVALIDPARAMETER for a specifier that is not an
  /// identifier, and ERROR_NOT_SUPPORTED as an HRESULT for a property that does not exist; the values before
  /// it are filled in. Returns S_FALSE without specifiers.
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
  std::shared_ptr<PropertyMap> properties_ = std::make_shared<PropertyMap>();  // shared with the enumerators
};

}  // namespace Qel::Lumetra::ShellExt
