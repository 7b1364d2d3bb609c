#include "qel_shell_ext_module.h"

#include <windows.h>

#include <utilapiset.h>

#include <algorithm>
#include <mutex>

using Qel::Com::ComPtr;
using Qel::Lumetra::ShellExt::Replacement;

CQelShellExtModule::CQelShellExtModule(std::span<ObjectMapEntry> objectMap)
    : objectMap_(objectMap),
      isReady_(SUCCEEDED(objectMapSection_.Create())),
      initFailed_(FAILED(section_.Create()) || !isReady_) {
  MakeCurrent(this);
}

CQelShellExtModule::~CQelShellExtModule() {
  for (ObjectMapEntry& entry : objectMap_) {
    if (void* const encoded = entry.classObject.exchange(nullptr); encoded != nullptr) {
      static_cast<IUnknown*>(DecodePointer(encoded))->Release();
    }
  }
}

HRESULT CQelShellExtModule::GetGITPtr(IGlobalInterfaceTable** table) {
  if (table == nullptr) return E_POINTER;
  *table = nullptr;
  const std::lock_guard guard(section_);
  if (!interfaceTable_) {
    const HRESULT result =
        CoCreateInstance(CLSID_StdGlobalInterfaceTable, nullptr, CLSCTX_INPROC_SERVER,
                         IID_IGlobalInterfaceTable, reinterpret_cast<void**>(interfaceTable_.Put()));
    if (FAILED(result)) return result;
  }
  *table = ComPtr(interfaceTable_).Detach();
  return S_OK;
}

HRESULT CQelShellExtModule::AddCommonRGSReplacements(std::vector<Replacement>& replacements) const {
  replacements.push_back({L"APPID", L"{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}"});
  return S_OK;
}

HRESULT CQelShellExtModule::GetClassObject(REFCLSID clsid, REFIID iid, void** classObject) {
  if (classObject == nullptr) return E_POINTER;
  *classObject = nullptr;
  if (!isReady_) return E_UNEXPECTED;

  const auto entry = std::ranges::find_if(objectMap_, [&clsid](const ObjectMapEntry& candidate) {
    return candidate.clsid != nullptr && candidate.makeClassObject != nullptr && *candidate.clsid == clsid;
  });
  if (entry == objectMap_.end()) return CLASS_E_CLASSNOTAVAILABLE;

  HRESULT result = S_OK;
  if (entry->classObject == nullptr) {
    const std::lock_guard guard(objectMapSection_);
    // Another thread may have created it in the meantime.
    if (entry->classObject == nullptr) result = MakeClassObject(*entry);
  }
  void* const encoded = entry->classObject;
  if (encoded != nullptr) {
    result = static_cast<IUnknown*>(DecodePointer(encoded))->QueryInterface(iid, classObject);
  }
  return SUCCEEDED(result) && *classObject == nullptr ? CLASS_E_CLASSNOTAVAILABLE : result;
}

HRESULT CQelShellExtModule::MakeClassObject(ObjectMapEntry& entry) {
  ComPtr<IUnknown> made;
  const HRESULT result =
      entry.makeClassObject(entry.makeInstance, IID_IUnknown, reinterpret_cast<void**>(made.Put()));
  if (SUCCEEDED(result) && made) entry.classObject = EncodePointer(made.Detach());
  return result;
}
