#include "class_factory.h"

namespace Qel::Com {

HRESULT CComClassFactory::CreateInstance(IUnknown* outer, REFIID iid, void** object) {
  if (object == nullptr) return E_POINTER;
  *object = nullptr;
  if (outer != nullptr && iid != kInterfaceId<IUnknown>) return CLASS_E_NOAGGREGATION;
  return makeInstance_(outer, iid, object);
}

HRESULT CComClassFactory::LockServer(BOOL lock) {
  if (lock != FALSE) {
    Module::Current().Lock();
  } else {
    Module::Current().Unlock();
  }
  return S_OK;
}

HRESULT MakeClassFactory(InstanceMaker makeInstance, REFIID iid, void** classObject) {
  return MakeObjectAs<CComObjectCached<CComClassFactory>>(iid, classObject, makeInstance);
}

}  // namespace Qel::Com
