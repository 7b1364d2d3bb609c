#include "server.h"

#include "class_ids.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {

std::wstring Server::Open(const std::wstring& path) {
  if (path.empty()) {
    ComPtr<IClassFactory> factory;
    const HRESULT result = CoGetClassObject(CLSID_QelShellExt, CLSCTX_INPROC_SERVER, nullptr,
                                            IID_IClassFactory, reinterpret_cast<void**>(factory.Put()));
    if (SUCCEEDED(result)) return {};
    if (result == REGDB_E_CLASSNOTREG) {
      return L"The extension is not registered on this computer: register it with \"regsvr32 "
             L"QelShellExt.DLL\", or name the DLL with --server.";
    }
    return L"The registered extension cannot be loaded: " + ResultText(result) + L".";
  }
  const HMODULE module = LoadLibraryExW(path.c_str(), nullptr, LOAD_WITH_ALTERED_SEARCH_PATH);
  if (module == nullptr) {
    return L"The server \"" + path + L"\" cannot be loaded: " + SystemErrorText(GetLastError()) + L".";
  }
  const FARPROC procedure = GetProcAddress(module, "DllGetClassObject");
  if (procedure == nullptr) {
    return L"The server \"" + path + L"\" is no COM server: it does not export DllGetClassObject.";
  }
  getClassObject_ = reinterpret_cast<decltype(getClassObject_)>(reinterpret_cast<void*>(procedure));
  return {};
}

HRESULT Server::Create(const CLSID& clsid, const IID& iid, void** object) const {
  if (getClassObject_ == nullptr) {
    return CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, iid, object);
  }
  ComPtr<IClassFactory> factory;
  const HRESULT result = getClassObject_(clsid, IID_IClassFactory, reinterpret_cast<void**>(factory.Put()));
  return FAILED(result) ? result : factory->CreateInstance(nullptr, iid, object);
}

}  // namespace Qel::Lumetra::ShellExt::Show
