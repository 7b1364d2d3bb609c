// The object that the shell makes for a file: it is given the path (IPersistFile::Load) and is then asked
// for a thumbnail, an info tip, Details columns and property sets. What a file holds is the reader's
// business (file_type_info.h); this class looks at no byte of it.
//
// One thread at a time; objects share nothing. Exceptions that a reader lets out leave the methods as they
// are.
#pragma once

#include <windows.h>

#include <fstream>
#include <memory>
#include <string>

#include "com_root.h"
#include "file_type_info.h"
#include "property_sets.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt {

class CShellExt : public Com::CComRoot<Com::SingleThreaded, IExtractImage, IPersistFile, IQueryInfo,
                                       IColumnProvider, IPropertySetStorage> {
 public:
  // IExtractImage. Every extraction is synchronous: GetLocation keeps the size, requests a cached thumbnail
  // and ignores everything else.
  HRESULT STDMETHODCALLTYPE GetLocation(LPWSTR pathBuffer, DWORD length, DWORD* priority, const SIZE* size,
                                        DWORD colourDepth, DWORD* flags) override;

  /// The bitmap is the caller's. E_FAIL without a file that has a picture.
  HRESULT STDMETHODCALLTYPE Extract(HBITMAP* thumbnail) override;

  // IPersistFile, of which the shell needs Load only.
  HRESULT STDMETHODCALLTYPE GetClassID(CLSID*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE IsDirty() override { return E_NOTIMPL; }

  /// Always S_OK: a file that cannot be opened, is of no known kind or is not valid makes the requests that
  /// follow fail. Meant to be called once: the stream stays open until the object goes, so the reader of a
  /// second call finds a failed stream.
  HRESULT STDMETHODCALLTYPE Load(LPCOLESTR path, DWORD mode) override;

  HRESULT STDMETHODCALLTYPE Save(LPCOLESTR, BOOL) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE SaveCompleted(LPCOLESTR) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetCurFile(LPOLESTR*) override { return E_NOTIMPL; }

  // IQueryInfo
  /// The tip (info_tip.h) is the caller's, to be freed with the task allocator. E_FAIL without a valid file.
  HRESULT STDMETHODCALLTYPE GetInfoTip(DWORD flags, WCHAR** tip) override;

  /// Always 0.
  HRESULT STDMETHODCALLTYPE GetInfoFlags(DWORD* flags) override;

  // IColumnProvider, which does without the file that was loaded: columns.h.
  HRESULT STDMETHODCALLTYPE Initialize(LPCSHCOLUMNINIT) override { return S_OK; }
  HRESULT STDMETHODCALLTYPE GetColumnInfo(DWORD index, SHCOLUMNINFO* info) override;
  HRESULT STDMETHODCALLTYPE GetItemData(LPCSHCOLUMNID column, LPCSHCOLUMNDATA item, VARIANT* value) override;

  // IPropertySetStorage, read-only. The sets are built at the first call after Load, and every Open of a set
  // gives the same storage. E_FAIL without a valid file.
  HRESULT STDMETHODCALLTYPE Open(REFFMTID set, DWORD mode, IPropertyStorage** storage) override;
  HRESULT STDMETHODCALLTYPE Enum(IEnumSTATPROPSETSTG** enumerator) override;
  HRESULT STDMETHODCALLTYPE Create(REFFMTID, const CLSID*, DWORD, DWORD, IPropertyStorage**) override {
    return STG_E_ACCESSDENIED;
  }
  HRESULT STDMETHODCALLTYPE Delete(REFFMTID) override { return STG_E_ACCESSDENIED; }

 protected:
  ~CShellExt() = default;

 private:
  bool HasValidReader() const { return reader_ && reader_->IsValid(); }

  HRESULT BuildPropertySetsOnce();

  std::ifstream stream_;
  std::unique_ptr<FileTypeInfo> reader_;  // reads from stream_, and goes before it
  std::wstring path_;
  SIZE thumbnailSize_{128, 128};
  std::shared_ptr<const PropertySets> propertySets_;  // null until asked for; shared with the enumerators
};

}  // namespace Qel::Lumetra::ShellExt
