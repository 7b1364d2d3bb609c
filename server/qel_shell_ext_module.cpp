#include "qel_shell_ext_module.h"

#include <algorithm>
#include <mutex>
#include <new>

using Qel::Com::ComPtr;
using Qel::Lumetra::ShellExt::Replacement;

CQelShellExtModule::CQelShellExtModule(HINSTANCE instance, std::span<ObjectMapEntry> objectMap) {
  classes_.instance = instance;
  classes_.objectMap = objectMap;
  if (SUCCEEDED(classes_.section.Create())) {
    classes_.size = sizeof classes_;
  } else {
    initFailed_ = true;
  }
  if (FAILED(section_.Create())) initFailed_ = true;
  MakeCurrent(this);
}

CQelShellExtModule::~CQelShellExtModule() {
  for (ObjectMapEntry& entry : classes_.objectMap) {
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

HRESULT CQelShellExtModule::RegisterServer() const {
  return UpdateRegistration(&Qel::Lumetra::ShellExt::RegisterServer);
}

HRESULT CQelShellExtModule::UnregisterServer() const {
  return UpdateRegistration(&Qel::Lumetra::ShellExt::UnregisterServer);
}

HRESULT CQelShellExtModule::UpdateRegistration(RegistrationStep* step) const {
  try {
    std::vector<Replacement> replacements;
    const HRESULT result = AddCommonRGSReplacements(replacements);
    if (FAILED(result)) return result;
    std::vector<UINT> scripts;
    for (const ObjectMapEntry& entry : classes_.objectMap) scripts.push_back(entry.registryScript);
    return step({classes_.instance, replacements, scripts});
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
}

HRESULT CQelShellExtModule::GetClassObject(REFCLSID clsid, REFIID iid, void** classObject) {
  if (classObject == nullptr) return E_POINTER;
  *classObject = nullptr;
  if (classes_.size == 0) return E_UNEXPECTED;

  const auto entry = std::ranges::find_if(classes_.objectMap, [&clsid](const ObjectMapEntry& candidate) {
    return candidate.clsid != nullptr && candidate.makeClassObject != nullptr && *candidate.clsid == clsid;
  });
  if (entry == classes_.objectMap.end()) return CLASS_E_CLASSNOTAVAILABLE;

  HRESULT result = S_OK;
  if (entry->classObject == nullptr) {
    const std::lock_guard guard(classes_.section);
    // Another thread may have made it meanwhile.
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
