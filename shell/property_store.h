// The property stores: what the shell's property system reads from a file that it hands over as a stream.
//
// The handlers differ only in the reader that they build. They read the header and nothing else, and refuse
// every change.
#pragma once

#include <windows.h>

#include <propsys.h>

#include <memory>

#include "com_root.h"
#include "com_stream.h"
#include "file_type_info.h"

namespace Qel::Lumetra::ShellExt {

/// Any thread may call: the object's own lock keeps its stream and reader to one at a time.
class CShellExtVista : public Com::CComRoot<Com::FreeThreaded, IInitializeWithStream, IPropertyStore,
                                            IPropertyStoreCapabilities> {
 public:
  /// Builds the reader on `stream`, which may be null, from where it stands. Always S_OK: a file that is not
  /// acceptable, or one for which there is no buffer, shows in GetValue. Nothing resets a stream object that
  /// an earlier file has left failed.
  HRESULT STDMETHODCALLTYPE Initialize(IStream* stream, DWORD mode) override;

  /// The reader of the class's file kind, which parses the header from `stream`; none is allowed.
  virtual std::unique_ptr<FileTypeInfo> CreateFileInfo(basic_comstream<char>& stream) = 0;

  /// Says that there are no properties, with the success code 6 and not S_OK: a caller that enumerates is to
  /// find none, and a caller that asks by key gets values.
  HRESULT STDMETHODCALLTYPE GetCount(DWORD* count) override;

  /// Answers the six keys all the same; E_UNEXPECTED and the null key after them.
  HRESULT STDMETHODCALLTYPE GetAt(DWORD index, PROPERTYKEY* key) override;

  /// `value` need not be initialised, and is empty after every failure but that of a file that is not valid
  /// (E_FAIL, nothing written). E_UNEXPECTED for a key without a property.
  HRESULT STDMETHODCALLTYPE GetValue(REFPROPERTYKEY key, PROPVARIANT* value) override;

  HRESULT STDMETHODCALLTYPE SetValue(REFPROPERTYKEY, REFPROPVARIANT) override { return E_FAIL; }

  /// Writes nothing and fails, but lets go of the stream. The values stay.
  HRESULT STDMETHODCALLTYPE Commit() override;

  HRESULT STDMETHODCALLTYPE IsPropertyWritable(REFPROPERTYKEY) override { return S_FALSE; }

 protected:
  ~CShellExtVista() = default;

 private:
  DWORD mode_ = 0;
  basic_comstream<char> stream_;
  std::unique_ptr<FileTypeInfo> reader_;
};

/// Files of the MRC family. A stream has no name, so all of them are described as .mrc.
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
