// The property-store handlers: objects that the property system gives a file's content as a stream and then
// asks for single properties. They are read-only, and differ only in the reader that they build.
#pragma once

#include <windows.h>

#include "com_root.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt {

class CShellExtVista : public Com::CComRoot<Com::FreeThreaded, IInitializeWithStream, IPropertyStore,
                                            IPropertyStoreCapabilities> {
 public:
  // IInitializeWithStream
  HRESULT STDMETHODCALLTYPE Initialize(IStream* stream, DWORD mode) override;

  // IPropertyStore
  HRESULT STDMETHODCALLTYPE GetCount(DWORD* count) override;
  HRESULT STDMETHODCALLTYPE GetAt(DWORD index, PROPERTYKEY* key) override;
  HRESULT STDMETHODCALLTYPE GetValue(REFPROPERTYKEY key, PROPVARIANT* value) override;
  HRESULT STDMETHODCALLTYPE SetValue(REFPROPERTYKEY key, REFPROPVARIANT value) override;
  HRESULT STDMETHODCALLTYPE Commit() override;

  // IPropertyStoreCapabilities
  HRESULT STDMETHODCALLTYPE IsPropertyWritable(REFPROPERTYKEY key) override;

 protected:
  ~CShellExtVista() = default;
};

class CShellExtVistaEbn : public CShellExtVista {};
class CShellExtVistaRaw : public CShellExtVista {};
class CShellExtVistaMrc : public CShellExtVista {};

}  // namespace Qel::Lumetra::ShellExt
