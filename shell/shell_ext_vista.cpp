#include "shell_ext_vista.h"

namespace Qel::Lumetra::ShellExt {

HRESULT CShellExtVista::Initialize(IStream*, DWORD) {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::GetCount(DWORD*) {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::GetAt(DWORD, PROPERTYKEY*) {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::GetValue(REFPROPERTYKEY, PROPVARIANT*) {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::SetValue(REFPROPERTYKEY, REFPROPVARIANT) {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::Commit() {
  return E_NOTIMPL;
}

HRESULT CShellExtVista::IsPropertyWritable(REFPROPERTYKEY) {
  return E_NOTIMPL;
}

}  // namespace Qel::Lumetra::ShellExt
