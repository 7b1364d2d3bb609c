#include "shell_ext.h"

#include <algorithm>
#include <tuple>

#include "file_type_factory.h"
#include "path_stream.h"

namespace Qel::Lumetra::ShellExt {

HRESULT CShellExt::GetLocation(LPWSTR, DWORD, DWORD*, const SIZE* size, DWORD, DWORD* flags) {
  if (size == nullptr || flags == nullptr) return E_POINTER;
  thumbnailSize_ = *size;
  *flags |= IEIFLAG_CACHE;
  return S_OK;
}

HRESULT CShellExt::Extract(HBITMAP* thumbnail) {
  if (thumbnail == nullptr) return E_POINTER;
  if (!HasValidFile()) return E_FAIL;
  *thumbnail = info_->CreateThumbnail(thumbnailSize_);
  return *thumbnail != nullptr ? S_OK : E_FAIL;
}

HRESULT CShellExt::Load(LPCOLESTR path, DWORD) {
  OpenPath(stream_, path);
  const std::wstring newPath = path != nullptr ? path : L"";
  info_ = CreateFileTypeInfo(stream_, GetExtension(newPath));
  path_ = newPath;
  propertySets_.clear();
  return S_OK;
}

HRESULT CShellExt::GetInfoTip(DWORD, WCHAR**) {
  return E_NOTIMPL;
}

HRESULT CShellExt::GetInfoFlags(DWORD*) {
  return E_NOTIMPL;
}

HRESULT CShellExt::Initialize(LPCSHCOLUMNINIT) {
  return E_NOTIMPL;
}

HRESULT CShellExt::GetColumnInfo(DWORD, SHCOLUMNINFO*) {
  return E_NOTIMPL;
}

HRESULT CShellExt::GetItemData(LPCSHCOLUMNID, LPCSHCOLUMNDATA, VARIANT*) {
  return E_NOTIMPL;
}

HRESULT CShellExt::Create(REFFMTID, const CLSID*, DWORD, DWORD, IPropertyStorage**) {
  return E_NOTIMPL;
}

HRESULT CShellExt::Open(REFFMTID, DWORD, IPropertyStorage**) {
  return E_NOTIMPL;
}

HRESULT CShellExt::Delete(REFFMTID) {
  return E_NOTIMPL;
}

HRESULT CShellExt::Enum(IEnumSTATPROPSETSTG**) {
  return E_NOTIMPL;
}

bool CShellExt::FormatIdLess::operator()(const FMTID& a, const FMTID& b) const {
  const auto head = [](const FMTID& id) { return std::tie(id.Data1, id.Data2, id.Data3); };
  if (head(a) != head(b)) return head(a) < head(b);
  return std::lexicographical_compare(std::begin(a.Data4), std::end(a.Data4), std::begin(b.Data4),
                                      std::end(b.Data4));
}

}  // namespace Qel::Lumetra::ShellExt
