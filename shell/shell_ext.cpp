#include "shell_ext.h"

#include <utility>

#include "columns.h"
#include "enum_statpropsetstg.h"
#include "file_type_factory.h"
#include "info_tip.h"
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
  if (!HasValidReader()) return E_FAIL;
  *thumbnail = reader_->CreateThumbnail(thumbnailSize_);
  return *thumbnail != nullptr ? S_OK : E_FAIL;
}

HRESULT CShellExt::Load(LPCOLESTR path, DWORD) {
  OpenPath(stream_, path);
  std::wstring newPath = path != nullptr ? path : L"";
  reader_ = CreateFileTypeInfo(stream_, GetExtension(newPath));
  path_ = std::move(newPath);
  propertySets_.reset();
  return S_OK;
}

HRESULT CShellExt::GetInfoTip(DWORD, WCHAR** tip) {
  if (!HasValidReader()) return E_FAIL;
  return tip != nullptr ? MakeInfoTip(*reader_, path_, tip) : E_POINTER;
}

HRESULT CShellExt::GetInfoFlags(DWORD* flags) {
  if (flags == nullptr) return E_POINTER;
  *flags = 0;
  return S_OK;
}

HRESULT CShellExt::GetColumnInfo(DWORD index, SHCOLUMNINFO* info) {
  return DescribeColumn(index, info);
}

HRESULT CShellExt::GetItemData(LPCSHCOLUMNID column, LPCSHCOLUMNDATA item, VARIANT* value) {
  return column != nullptr ? ReadColumn(*column, item, value) : E_POINTER;
}

HRESULT CShellExt::Open(REFFMTID set, DWORD, IPropertyStorage** storage) {
  if (const HRESULT result = BuildPropertySetsOnce(); FAILED(result)) return result;
  const auto found = propertySets_->find(set);
  if (found == propertySets_->end()) return STG_E_FILENOTFOUND;
  if (storage == nullptr) return E_POINTER;
  *storage = Com::ComPtr(found->second).Detach();
  return S_OK;
}

HRESULT CShellExt::Enum(IEnumSTATPROPSETSTG** enumerator) {
  if (const HRESULT result = BuildPropertySetsOnce(); FAILED(result)) return result;
  return CEnumSTATPROPSETSTG::Make(propertySets_, enumerator);
}

HRESULT CShellExt::BuildPropertySetsOnce() {
  if (propertySets_ != nullptr) return S_OK;
  return HasValidReader() ? BuildPropertySets(*reader_, propertySets_) : E_FAIL;
}

}  // namespace Qel::Lumetra::ShellExt
