// The object that the shell creates for a file. It loads the path (IPersistFile::Load) and then provides a
// thumbnail, an info tip, Details columns and property sets. Only the reader (file_type_info.h) looks at the
// bytes of the file.
//
// One thread at a time uses an object, and objects share nothing. The methods do not catch exceptions of the
// reader.
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
  // IExtractImage. Every extraction is synchronous: GetLocation stores the size, asks the shell to cache the
  // thumbnail, and ignores everything else.
  HRESULT STDMETHODCALLTYPE GetLocation(LPWSTR pathBuffer, DWORD length, DWORD* priority, const SIZE* size,
                                        DWORD colourDepth, DWORD* flags) override;

  /// Makes the thumbnail, a bitmap that the caller owns. Returns E_FAIL for a file without a thumbnail, and
  /// E_POINTER for a null `thumbnail`.
  HRESULT STDMETHODCALLTYPE Extract(HBITMAP* thumbnail) override;

  // IPersistFile. The shell needs only Load.
  HRESULT STDMETHODCALLTYPE GetClassID(CLSID*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE IsDirty() override { return E_NOTIMPL; }

  /// Opens the file at `path`. Always returns S_OK: for a file that cannot be opened, is of an unknown kind
  /// or is not valid, the later requests fail. Call it only once: the stream stays open until the object is
  /// destroyed, so the reader of a second call gets a failed stream.
  HRESULT STDMETHODCALLTYPE Load(LPCOLESTR path, DWORD mode) override;

  HRESULT STDMETHODCALLTYPE Save(LPCOLESTR, BOOL) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE SaveCompleted(LPCOLESTR) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetCurFile(LPOLESTR*) override { return E_NOTIMPL; }

  // IQueryInfo
  /// Makes the tip (info_tip.h), which the caller frees with the task allocator. Returns E_FAIL without a
  /// valid file.
  HRESULT STDMETHODCALLTYPE GetInfoTip(DWORD flags, WCHAR** tip) override;

  /// Sets `flags` to 0.
  HRESULT STDMETHODCALLTYPE GetInfoFlags(DWORD* flags) override;

  // IColumnProvider (columns.h). It does not use the loaded file.
  HRESULT STDMETHODCALLTYPE Initialize(LPCSHCOLUMNINIT) override { return S_OK; }
  HRESULT STDMETHODCALLTYPE GetColumnInfo(DWORD index, SHCOLUMNINFO* info) override;
  HRESULT STDMETHODCALLTYPE GetItemData(LPCSHCOLUMNID column, LPCSHCOLUMNDATA item, VARIANT* value) override;

  // IPropertySetStorage, read-only. The sets are created by the first call after Load, and every Open of a
  // set returns the same storage. Returns E_FAIL without a valid file.
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
  std::unique_ptr<FileTypeInfo> reader_;  // reads from stream_, so it is destroyed first
  std::wstring path_;
  SIZE thumbnailSize_{128, 128};
  std::shared_ptr<const PropertySets> propertySets_;  // created on first use; shared with the enumerators
};

}  // namespace Qel::Lumetra::ShellExt
