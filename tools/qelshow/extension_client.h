// Loads the extension, as it is registered or from the DLL at a path, and creates its objects.
#pragma once

#include <windows.h>

#include <objidl.h>

#include <string>

#include "com_ptr.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt::Show {

using Com::ComPtr;

class ExtensionClient {
 public:
  /// Loads the DLL at `path`, or the registered one if `path` is empty. COM must be initialised. Returns a
  /// sentence for the user if that fails, after which no object can be created.
  std::wstring Open(const std::wstring& path);

  /// Creates an object of the class and queries it for the interface.
  template <class Interface>
  HRESULT Create(const CLSID& clsid, ComPtr<Interface>& object) const {
    return Create(clsid, Com::kInterfaceId<Interface>, reinterpret_cast<void**>(object.Put()));
  }

 private:
  HRESULT Create(const CLSID& clsid, const IID& iid, void** object) const;

  // A DLL stays loaded until the process ends: nothing is gained by unloading it before.
  decltype(&DllGetClassObject) getClassObject_ = nullptr;
};

}  // namespace Qel::Lumetra::ShellExt::Show
