// The property stores, through which the shell's property system reads a file that it hands over as a stream.
//
// The handlers differ only in the reader that they create. They read only the header and reject every change.
#pragma once

#include <windows.h>

#include <propsys.h>

#include <memory>

#include "com_root.h"
#include "com_stream.h"
#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Any thread may call the methods. The object's lock lets only one thread at a time use the stream and the
/// reader.
class CShellExtVista : public Com::CComRoot<Com::FreeThreaded, IInitializeWithStream, IPropertyStore,
                                            IPropertyStoreCapabilities> {
 public:
  /// Creates the reader on `stream`, which may be null, at its current position. Always returns S_OK: if the
  /// file is not acceptable or there is no memory for the buffer, GetValue fails. Intentional: a failed
  /// stream state from an earlier file is not cleared.
  HRESULT STDMETHODCALLTYPE Initialize(IStream* stream, DWORD mode) override;

  /// Creates the reader of the class's file kind, which parses the header from `stream`. May return null.
  virtual std::unique_ptr<FileTypeInfo> CreateFileInfo(basic_comstream<char>& stream) = 0;

  /// Reports 0 properties and returns the success code 6 instead of S_OK: a caller that enumerates finds
  /// none, and a caller that requests a value by key gets it.
  HRESULT STDMETHODCALLTYPE GetCount(DWORD* count) override;

  /// Returns one of the six keys, although GetCount reports none. For a larger index returns E_UNEXPECTED and
  /// the null key.
  HRESULT STDMETHODCALLTYPE GetAt(DWORD index, PROPERTYKEY* key) override;

  /// Reads the value of `key`. Returns E_UNEXPECTED for a key without a property, and E_FAIL without a valid
  /// file. `value` need not be initialised. After a failure it is empty, except without a valid file, where
  /// it is not written.
  HRESULT STDMETHODCALLTYPE GetValue(REFPROPERTYKEY key, PROPVARIANT* value) override;

  HRESULT STDMETHODCALLTYPE SetValue(REFPROPERTYKEY, REFPROPVARIANT) override { return E_FAIL; }

  /// Writes nothing and returns E_FAIL, but releases the stream. The values remain available.
  HRESULT STDMETHODCALLTYPE Commit() override;

  HRESULT STDMETHODCALLTYPE IsPropertyWritable(REFPROPERTYKEY) override { return S_FALSE; }

 protected:
  ~CShellExtVista() = default;

 private:
  DWORD mode_ = 0;
  basic_comstream<char> stream_;
  std::unique_ptr<FileTypeInfo> reader_;
};

/// Handles the MRC family. A stream has no name, so every file is described as .mrc.
class CShellExtVistaMrc : public CShellExtVista {
 public:
  std::unique_ptr<FileTypeInfo> CreateFileInfo(basic_comstream<char>& stream) override;
};

class CShellExtVistaEbn : public CShellExtVista {
 public:
  std::unique_ptr<FileTypeInfo> CreateFileInfo(basic_comstream<char>& stream) override;
};

class CShellExtVistaRaw : public CShellExtVista {
 public:
  std::unique_ptr<FileTypeInfo> CreateFileInfo(basic_comstream<char>& stream) override;
};

}  // namespace Qel::Lumetra::ShellExt
