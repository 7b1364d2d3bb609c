// Loads the extension, either the registered one or the DLL at a path, and creates its objects.
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
  /// Loads the DLL at `path`, or the registered one if `path` is empty. COM must be initialised. On success
  /// returns an empty string; on failure returns a sentence for the user, and no object can be created.
  std::wstring Open(const std::wstring& path);

  /// Creates an object of the class and returns its interface in `object`. Returns the
  /// extension's result.
  template <class Interface>
  HRESULT Create(const CLSID& clsid, ComPtr<Interface>& object) const {
    return Create(clsid, Com::kInterfaceId<Interface>, reinterpret_cast<void**>(object.Put()));
  }

 private:
  HRESULT Create(const CLSID& clsid, const IID& iid, void** object) const;

  // The DLL stays loaded until the process ends, as there is no reason to unload it earlier.
  decltype(&DllGetClassObject) getClassObject_ = nullptr;
};

}  // namespace Qel::Lumetra::ShellExt::Show
