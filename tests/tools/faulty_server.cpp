// A server that misbehaves on purpose, in place of the extension. The name of the file decides how. It also
// has fewer interfaces and classes than the extension.
#include <windows.h>

#include <stdexcept>
#include <string_view>

#include "class_factory.h"
#include "class_ids.h"
#include "com_object.h"
#include "com_root.h"
#include "module.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

class FaultyServerModule final : public Com::Module {
 public:
  FaultyServerModule() { MakeCurrent(this); }
  LONG Lock() override { return ++locks_; }
  LONG Unlock() override { return --locks_; }
  LONG GetLockCount() const override { return locks_; }
  HRESULT GetGITPtr(IGlobalInterfaceTable**) override { return E_NOTIMPL; }

 private:
  LONG locks_ = 0;
};

FaultyServerModule g_module;

class FaultyObject : public Com::CComRoot<Com::SingleThreaded, IExtractImage, IPersistFile, IQueryInfo> {
 public:
  HRESULT STDMETHODCALLTYPE Load(LPCOLESTR path, DWORD) override {
    const std::wstring_view name(path);
    const auto isNamed = [name](std::wstring_view part) {
      return name.find(part) != std::wstring_view::npos;
    };
    faultsInTip_ = isNamed(L"fault in tip");
    if (isNamed(L"fault in load")) RaiseException(EXCEPTION_ACCESS_VIOLATION, 0, 0, nullptr);
    if (isNamed(L"error thrown")) throw std::runtime_error("no such luck");
    if (isNamed(L"number thrown")) throw 42;
    return S_OK;
  }

  HRESULT STDMETHODCALLTYPE GetInfoTip(DWORD, WCHAR**) override {
    if (faultsInTip_) RaiseException(EXCEPTION_STACK_OVERFLOW, 0, 0, nullptr);
    return E_NOTIMPL;
  }

  HRESULT STDMETHODCALLTYPE GetInfoFlags(DWORD*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetLocation(LPWSTR, DWORD, DWORD*, const SIZE*, DWORD, DWORD*) override {
    return S_OK;
  }
  HRESULT STDMETHODCALLTYPE Extract(HBITMAP*) override { return E_FAIL; }
  HRESULT STDMETHODCALLTYPE GetClassID(CLSID*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE IsDirty() override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE Save(LPCOLESTR, BOOL) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE SaveCompleted(LPCOLESTR) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetCurFile(LPOLESTR*) override { return E_NOTIMPL; }

 private:
  bool faultsInTip_ = false;
};

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing

extern "C" HRESULT __declspec(dllexport) STDAPICALLTYPE DllGetClassObject(REFCLSID clsid, REFIID iid,
                                                                          void** classObject) {
  using namespace Qel;
  *classObject = nullptr;
  if (clsid == Lumetra::ShellExt::CLSID_QelShellExtVistaEbn) {
    RaiseException(EXCEPTION_ACCESS_VIOLATION, 0, 0, nullptr);
  }
  if (clsid != Lumetra::ShellExt::CLSID_QelShellExt) return CLASS_E_CLASSNOTAVAILABLE;
  return Com::MakeClassFactory(&Com::MakeInstance<Lumetra::ShellExt::Testing::FaultyObject>, iid,
                               classObject);
}
