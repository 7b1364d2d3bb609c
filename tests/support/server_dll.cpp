#include "server_dll.h"

#include <array>
#include <stdexcept>
#include <type_traits>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

template <class Function>
Function* Export(HMODULE module, const char* name) {
  return reinterpret_cast<Function*>(reinterpret_cast<void*>(GetProcAddress(module, name)));
}

}  // namespace

ServerDll::ServerDll()
    : module_(LoadLibraryW(Path().c_str())),
      getClassObject_(Export<std::remove_pointer_t<LPFNGETCLASSOBJECT>>(module_, "DllGetClassObject")),
      canUnloadNow_(Export<std::remove_pointer_t<LPFNCANUNLOADNOW>>(module_, "DllCanUnloadNow")) {
  if (getClassObject_ == nullptr || canUnloadNow_ == nullptr) {
    throw std::runtime_error(Path().string() + " does not load, or lacks an export");
  }
}

ServerDll::~ServerDll() {
  FreeLibrary(module_);
}

std::filesystem::path ServerDll::Path() {
  // The tests are in a folder next to the DLL.
  std::array<wchar_t, 1024> program{};
  GetModuleFileNameW(nullptr, program.data(), static_cast<DWORD>(program.size()));
  return std::filesystem::path(program.data()).parent_path().parent_path() / L"QelShellExt.dll";
}

ComPtr<IClassFactory> ServerDll::Factory(REFCLSID clsid) const {
  ComPtr<IClassFactory> factory;
  EXPECT_EQ(GetClassObject(clsid, IID_IClassFactory, reinterpret_cast<void**>(factory.Put())), S_OK);
  return factory;
}

LONG ServerDll::LockCount() const {
  constexpr LONG kLimit = 1000;
  LONG count = 0;
  {
    // This reference may count as a lock by itself: it does if nobody else holds the factory.
    const ComPtr<IClassFactory> factory = Factory(kRawHandlerClass);
    const bool countsItself = References(factory) == 1;
    while (CanUnloadNow() != S_OK && count <= kLimit) {
      factory->LockServer(FALSE);
      ++count;
    }
    for (LONG i = 0; i < count; ++i) factory->LockServer(TRUE);
    if (countsItself) --count;
  }
  EXPECT_LE(count, kLimit);
  return count <= kLimit ? count : -1;
}

HRESULT OuterObject::QueryInterface(REFIID iid, void** object) {
  if (iid != IID_IUnknown) return inner->QueryInterface(iid, object);
  *object = static_cast<IUnknown*>(this);
  AddRef();
  return S_OK;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
