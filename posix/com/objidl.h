// Stand-in for the Windows header of COM interfaces: the byte stream, which core reads and tests implement,
// and the creation of objects of registered classes, which always fails because no class is registered.
// Layouts and results are those of Windows.
#pragma once

#include <unknwn.h>
#include <windows.h>

#include <cstdint>

constexpr HRESULT STG_E_ACCESSDENIED = static_cast<HRESULT>(0x80030005);
constexpr HRESULT STG_E_READFAULT = static_cast<HRESULT>(0x8003001E);
constexpr HRESULT REGDB_E_CLASSNOTREG = static_cast<HRESULT>(0x80040154);

union LARGE_INTEGER {
  std::int64_t QuadPart;
};
union ULARGE_INTEGER {
  std::uint64_t QuadPart;
};

struct STATSTG;

struct ISequentialStream : IUnknown {
  virtual HRESULT Read(void* bytes, ULONG count, ULONG* read) = 0;
  virtual HRESULT Write(const void* bytes, ULONG count, ULONG* written) = 0;

 protected:
  ~ISequentialStream() = default;
};

struct IStream : ISequentialStream {
  virtual HRESULT Seek(LARGE_INTEGER move, DWORD origin, ULARGE_INTEGER* position) = 0;
  virtual HRESULT SetSize(ULARGE_INTEGER size) = 0;
  virtual HRESULT CopyTo(IStream* stream, ULARGE_INTEGER count, ULARGE_INTEGER* read,
                         ULARGE_INTEGER* written) = 0;
  virtual HRESULT Commit(DWORD flags) = 0;
  virtual HRESULT Revert() = 0;
  virtual HRESULT LockRegion(ULARGE_INTEGER offset, ULARGE_INTEGER count, DWORD type) = 0;
  virtual HRESULT UnlockRegion(ULARGE_INTEGER offset, ULARGE_INTEGER count, DWORD type) = 0;
  virtual HRESULT Stat(STATSTG* stat, DWORD flags) = 0;
  virtual HRESULT Clone(IStream** stream) = 0;

 protected:
  ~IStream() = default;
};

struct IGlobalInterfaceTable : IUnknown {
 protected:
  ~IGlobalInterfaceTable() = default;
};

inline constexpr CLSID CLSID_StdGlobalInterfaceTable = {0x323, 0, 0, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};
inline constexpr IID IID_IGlobalInterfaceTable = {0x146, 0, 0, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};
constexpr DWORD CLSCTX_INPROC_SERVER = 1;

inline HRESULT CoCreateInstance(REFCLSID, IUnknown*, DWORD, REFIID, void** object) {
  *object = nullptr;
  return REGDB_E_CLASSNOTREG;
}
