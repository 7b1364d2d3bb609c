// The object that the shell makes for a file: it is given the path (IPersistFile::Load) and is then asked
// for a thumbnail, an info tip, Details columns and property sets. What a file holds is the reader's
// business (file_type_info.h); this class looks at no byte of it.
//
// One thread at a time; objects share nothing. Exceptions that a reader lets out leave the methods as they
// are.
#pragma once

#include <windows.h>

#include <fstream>
#include <map>
#include <memory>
#include <string>

#include "com_ptr.h"
#include "com_root.h"
#include "file_type_info.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt {

class CShellExt : public Com::CComRoot<Com::SingleThreaded, IExtractImage, IPersistFile, IQueryInfo,
                                       IColumnProvider, IPropertySetStorage> {
 public:
  // IExtractImage. Every extraction is synchronous: of what GetLocation is told only the size is kept, and
  // of what it can answer only the wish to have the thumbnail cached is given.
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
  HRESULT STDMETHODCALLTYPE GetInfoTip(DWORD flags, WCHAR** tip) override;
  HRESULT STDMETHODCALLTYPE GetInfoFlags(DWORD* flags) override;

  // IColumnProvider
  HRESULT STDMETHODCALLTYPE Initialize(LPCSHCOLUMNINIT init) override;
  HRESULT STDMETHODCALLTYPE GetColumnInfo(DWORD index, SHCOLUMNINFO* info) override;
  HRESULT STDMETHODCALLTYPE GetItemData(LPCSHCOLUMNID column, LPCSHCOLUMNDATA file, VARIANT* value) override;

  // IPropertySetStorage
  HRESULT STDMETHODCALLTYPE Create(REFFMTID set, const CLSID* clsid, DWORD flags, DWORD mode,
                                   IPropertyStorage** storage) override;
  HRESULT STDMETHODCALLTYPE Open(REFFMTID set, DWORD mode, IPropertyStorage** storage) override;
  HRESULT STDMETHODCALLTYPE Delete(REFFMTID set) override;
  HRESULT STDMETHODCALLTYPE Enum(IEnumSTATPROPSETSTG** sets) override;

 protected:
  ~CShellExt() = default;

 private:
  /// Orders format ids by their fields, the first one first.
  struct FormatIdLess {
    bool operator()(const FMTID& a, const FMTID& b) const;
  };

  bool HasValidFile() const { return info_ && info_->IsValid(); }

  std::ifstream stream_;
  std::unique_ptr<FileTypeInfo> info_;  // reads from stream_, and goes before it
  std::wstring path_;
  SIZE thumbnailSize_{128, 128};
  std::map<FMTID, Com::ComPtr<IPropertyStorage>, FormatIdLess> propertySets_;
};

}  // namespace Qel::Lumetra::ShellExt
