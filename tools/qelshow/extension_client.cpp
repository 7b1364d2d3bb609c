#include "extension_client.h"

#include <cstdint>
#include <filesystem>
#include <fstream>

#include "class_ids.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// Returns the processor type of a program or DLL; IMAGE_FILE_MACHINE_UNKNOWN if it cannot be determined.
WORD MachineOf(const std::wstring& path) {
  std::ifstream file(std::filesystem::path(path), std::ios::binary);
  IMAGE_DOS_HEADER start{};
  file.read(reinterpret_cast<char*>(&start), sizeof start);
  if (!file || start.e_magic != IMAGE_DOS_SIGNATURE) return IMAGE_FILE_MACHINE_UNKNOWN;
  struct {
    DWORD signature;
    WORD machine;
  } header{};
  file.seekg(start.e_lfanew);
  file.read(reinterpret_cast<char*>(&header), sizeof header);
  return file && header.signature == IMAGE_NT_SIGNATURE ? header.machine : WORD{IMAGE_FILE_MACHINE_UNKNOWN};
}

/// Returns why the system cannot load the DLL.
std::wstring LoadingProblem(const std::wstring& path, DWORD error) {
  if (error == ERROR_MOD_NOT_FOUND && GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES) {
    return L"another DLL that it needs is missing (error 126)";
  }
  if (error != ERROR_BAD_EXE_FORMAT) return SystemErrorText(error);
  switch (MachineOf(path)) {
    case IMAGE_FILE_MACHINE_AMD64:
    case IMAGE_FILE_MACHINE_UNKNOWN: return L"it is damaged or not a DLL";
    case IMAGE_FILE_MACHINE_I386: return L"it is for 32-bit programs; use the 64-bit DLL";
    default: return L"it is built for another kind of processor; use the DLL for x64";
  }
}

}  // namespace

std::wstring ExtensionClient::Open(const std::wstring& path) {
  if (path.empty()) {
    ComPtr<IClassFactory> factory;
    const HRESULT result = CoGetClassObject(CLSID_QelShellExt, CLSCTX_INPROC_SERVER, nullptr,
                                            IID_IClassFactory, reinterpret_cast<void**>(factory.Put()));
    if (SUCCEEDED(result)) return {};
    if (result == REGDB_E_CLASSNOTREG) {
      return L"QelShellExt is not registered on this computer.";
    }
    return L"The registered extension cannot be loaded: " + ResultText(result) + L".";
  }
  const HMODULE module = LoadLibraryExW(path.c_str(), nullptr, LOAD_WITH_ALTERED_SEARCH_PATH);
  if (module == nullptr) {
    return L"The DLL \"" + path + L"\" cannot be loaded: " + LoadingProblem(path, GetLastError()) + L".";
  }
  const FARPROC procedure = GetProcAddress(module, "DllGetClassObject");
  if (procedure == nullptr) {
    return L"The DLL \"" + path + L"\" is not the extension: it does not export DllGetClassObject.";
  }
  getClassObject_ = reinterpret_cast<decltype(getClassObject_)>(reinterpret_cast<void*>(procedure));
  return {};
}

HRESULT ExtensionClient::Create(const CLSID& clsid, const IID& iid, void** object) const {
  if (getClassObject_ == nullptr) {
    return CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, iid, object);
  }
  ComPtr<IClassFactory> factory;
  const HRESULT result = getClassObject_(clsid, IID_IClassFactory, reinterpret_cast<void**>(factory.Put()));
  return FAILED(result) ? result : factory->CreateInstance(nullptr, iid, object);
}

}  // namespace Qel::Lumetra::ShellExt::Show
