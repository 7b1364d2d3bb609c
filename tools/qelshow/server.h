// The extension as this program reaches it: the registered server, or a DLL named by its path.
#pragma once

#include <windows.h>

#include <objidl.h>

#include <string>

#include "com_ptr.h"
#include "shell_interfaces.h"

namespace Qel::Lumetra::ShellExt::Show {

using Com::ComPtr;

class Server {
 public:
  /// `path` names the DLL; empty means the registered server. COM must be initialised. Answers a sentence for
  /// the user when the server cannot be had, and is of no use then.
  std::wstring Open(const std::wstring& path);

  /// A new object of the class, seen through one of its interfaces.
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
