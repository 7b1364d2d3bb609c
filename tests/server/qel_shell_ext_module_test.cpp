#include "qel_shell_ext_module.h"

#include <gtest/gtest.h>

#include <array>

#include "import_patch.h"
#include "property_store.h"
#include "server_dll.h"
#include "virtual_slot.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr CLSID kClass = {0x12345678, 0x1234, 0x1234, {1, 2, 3, 4, 5, 6, 7, 8}};

/// Has IUnknown. For IClassFactory it returns success without an object.
class FaultyFactory final : public IUnknown {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    *object = iid == IID_IClassFactory ? nullptr : this;
    if (*object != nullptr) AddRef();
    return S_OK;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
  ULONG STDMETHODCALLTYPE Release() override { return --references; }

  ULONG references = 1;
};

FaultyFactory g_factory;
int g_makerCalls = 0;
HRESULT g_makerResult = S_OK;

HRESULT MakeFaultyFactory(Com::InstanceMaker, REFIID iid, void** classObject) {
  ++g_makerCalls;
  EXPECT_EQ(iid, IID_IUnknown);
  return FAILED(g_makerResult) ? g_makerResult : g_factory.QueryInterface(iid, classObject);
}

HRESULT MakeNoFactory(Com::InstanceMaker, REFIID, void**) {
  return S_FALSE;
}

class Module : public testing::Test {
 protected:
  Module() {
    g_makerCalls = 0;
    g_makerResult = S_OK;
  }

  /// Returns the module's result for the class object of `kClass`.
  static HRESULT GetClassObject(CQelShellExtModule& module, REFIID iid = IID_IUnknown) {
    void* answer = &answer;
    const HRESULT result = module.GetClassObject(kClass, iid, &answer);
    EXPECT_EQ(answer, SUCCEEDED(result) ? &g_factory : nullptr);
    if (SUCCEEDED(result)) g_factory.Release();
    return result;
  }
};

TEST_F(Module, ListsItsClassesInTheOrderOfTheirRegistration) {
  struct Row {
    CLSID clsid;
    UINT script;
  };
  const Row rows[] = {
      {kShellExtClass, 102}, {kEbnHandlerClass, 104}, {kRawHandlerClass, 107}, {kMrcHandlerClass, 106}};
  const auto map = ObjectMap();
  ASSERT_EQ(map.size(), std::size(rows));
  for (std::size_t i = 0; i < map.size(); ++i) {
    EXPECT_EQ(*map[i].clsid, rows[i].clsid);
    EXPECT_EQ(map[i].registryScript, rows[i].script);
  }
}

TEST_F(Module, HasItsVirtualFunctionsInOrder) {
  // The destructor occupies slots 0 and 1.
  EXPECT_EQ(VirtualSlot(&CQelShellExtModule::Lock), 2u);
  EXPECT_EQ(VirtualSlot(&CQelShellExtModule::Unlock), 3u);
  EXPECT_EQ(VirtualSlot(&CQelShellExtModule::GetLockCount), 4u);
  EXPECT_EQ(VirtualSlot(&CQelShellExtModule::GetGITPtr), 5u);
  EXPECT_EQ(VirtualSlot(&CQelShellExtModule::AddCommonRGSReplacements), 6u);
}

TEST_F(Module, MakesPropertyStoresWithCreateFileInfoAfterInitialize) {
  EXPECT_EQ(VirtualSlot(&CShellExtVista::Initialize), 3u);
  EXPECT_EQ(VirtualSlot(&CShellExtVista::CreateFileInfo), 4u);
}

TEST_F(Module, SkipsEntriesThatAreEmptyOrMakeNoClassObject) {
  std::array<ObjectMapEntry, 3> map{{{}, {&kClass}, {&kClass, 0, &MakeFaultyFactory}}};
  CQelShellExtModule module(map);
  EXPECT_EQ(GetClassObject(module), S_OK);

  const std::span entries = map;
  CQelShellExtModule without(entries.first(2));
  EXPECT_EQ(GetClassObject(without), CLASS_E_CLASSNOTAVAILABLE);
}

TEST_F(Module, KeepsTheClassObjectEncodedUntilItIsDestroyed) {
  std::array<ObjectMapEntry, 1> map{{{&kClass, 0, &MakeFaultyFactory}}};
  {
    CQelShellExtModule module(map);
    EXPECT_EQ(map[0].classObject, nullptr);
    EXPECT_EQ(GetClassObject(module), S_OK);
    EXPECT_EQ(GetClassObject(module), S_OK);
    EXPECT_EQ(g_makerCalls, 1);
    EXPECT_EQ(g_factory.references, 2u);
    EXPECT_NE(map[0].classObject, &g_factory);
    EXPECT_EQ(DecodePointer(map[0].classObject), &g_factory);
  }
  EXPECT_EQ(g_factory.references, 1u);
}

TEST_F(Module, ReturnsTheMakersFailureAndCallsItAgain) {
  std::array<ObjectMapEntry, 1> map{{{&kClass, 0, &MakeFaultyFactory}}};
  CQelShellExtModule module(map);
  g_makerResult = E_OUTOFMEMORY;
  EXPECT_EQ(GetClassObject(module), E_OUTOFMEMORY);
  EXPECT_EQ(map[0].classObject, nullptr);
  g_makerResult = S_OK;
  EXPECT_EQ(GetClassObject(module), S_OK);
  EXPECT_EQ(g_makerCalls, 2);
}

TEST_F(Module, TreatsSuccessWithoutAnObjectAsAnUnavailableClass) {
  std::array<ObjectMapEntry, 1> map{{{&kClass, 0, &MakeNoFactory}}};
  CQelShellExtModule module(map);
  EXPECT_EQ(GetClassObject(module), CLASS_E_CLASSNOTAVAILABLE);

  std::array<ObjectMapEntry, 1> faultyMap{{{&kClass, 0, &MakeFaultyFactory}}};
  CQelShellExtModule faulty(faultyMap);
  EXPECT_EQ(GetClassObject(faulty, IID_IClassFactory), CLASS_E_CLASSNOTAVAILABLE);
}

/// The index, from 0, of the critical section whose creation fails, and the error that the failure sets.
int g_failingSection = 0;
DWORD g_sectionError = ERROR_SUCCESS;

BOOL WINAPI MakeSection(CRITICAL_SECTION* section, DWORD) {
  if (g_failingSection-- == 0) {
    SetLastError(g_sectionError);
    return FALSE;
  }
  InitializeCriticalSection(section);
  return TRUE;
}

TEST_F(Module, RefusesToBeLoadedWithoutItsLocks) {
  const ImportPatch patch(GetModuleHandleW(nullptr), "InitializeCriticalSectionAndSpinCount", &MakeSection);
  std::array<ObjectMapEntry, 1> map{{{&kClass, 0, &MakeFaultyFactory}}};
  g_sectionError = ERROR_NOT_ENOUGH_MEMORY;
  {
    g_failingSection = 0;
    CQelShellExtModule module(map);
    EXPECT_TRUE(module.initFailed());
    EXPECT_EQ(GetClassObject(module), E_UNEXPECTED);  // the lock of the class objects is missing
  }
  {
    g_failingSection = 1;
    CQelShellExtModule module(map);
    EXPECT_TRUE(module.initFailed());
    EXPECT_EQ(GetClassObject(module), S_OK);  // the lock of the class objects exists
  }
  {
    g_failingSection = 2;
    const CQelShellExtModule module(map);
    EXPECT_FALSE(module.initFailed());
  }
}

TEST_F(Module, IgnoresAFailureOfALockThatSetsNoError) {
  const ImportPatch patch(GetModuleHandleW(nullptr), "InitializeCriticalSectionAndSpinCount", &MakeSection);
  g_sectionError = ERROR_SUCCESS;
  for (const int section : {0, 1}) {
    g_failingSection = section;
    const CQelShellExtModule module({});
    EXPECT_FALSE(module.initFailed());
  }
}

TEST_F(Module, CountsItsLocks) {
  CQelShellExtModule module({});
  EXPECT_FALSE(module.initFailed());
  EXPECT_EQ(module.GetLockCount(), 0);
  EXPECT_EQ(module.Lock(), 1);
  EXPECT_EQ(module.Lock(), 2);
  EXPECT_EQ(module.GetLockCount(), 2);
  EXPECT_EQ(module.Unlock(), 1);
  EXPECT_EQ(module.Unlock(), 0);
}

TEST_F(Module, ReturnsTheInterfaceTableOfTheProcess) {
  CQelShellExtModule module({});
  EXPECT_EQ(module.GetGITPtr(nullptr), E_POINTER);

  ComPtr<IGlobalInterfaceTable> table;
  EXPECT_EQ(module.GetGITPtr(table.Put()), CO_E_NOTINITIALIZED);
  EXPECT_FALSE(table);

  ASSERT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), S_OK);
  {
    EXPECT_EQ(module.GetGITPtr(table.Put()), S_OK);
    ASSERT_TRUE(table);
    ComPtr<IGlobalInterfaceTable> again;
    EXPECT_EQ(module.GetGITPtr(again.Put()), S_OK);
    EXPECT_EQ(again.Get(), table.Get());
  }
  table = {};
  CoUninitialize();
}

/// An interface table that counts its references.
class FakeTable final : public IUnknown {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID, void**) override { return E_NOINTERFACE; }
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
  ULONG STDMETHODCALLTYPE Release() override { return --references; }

  ULONG references = 0;
};

FakeTable g_table;

HRESULT WINAPI MakeFakeTable(REFCLSID clsid, IUnknown* outer, DWORD context, REFIID iid, void** table) {
  EXPECT_EQ(clsid, CLSID_StdGlobalInterfaceTable);
  EXPECT_EQ(outer, nullptr);
  EXPECT_EQ(context, DWORD{CLSCTX_INPROC_SERVER});
  EXPECT_EQ(iid, IID_IGlobalInterfaceTable);
  g_table.AddRef();
  *table = &g_table;
  return S_OK;
}

TEST_F(Module, AddsAReferenceToTheInterfaceTableForEveryCaller) {
  {
    CQelShellExtModule module({});
    const ImportPatch patch(GetModuleHandleW(nullptr), "CoCreateInstance", &MakeFakeTable);
    for (const ULONG callers : {1u, 2u}) {
      IGlobalInterfaceTable* table = nullptr;
      EXPECT_EQ(module.GetGITPtr(&table), S_OK);
      EXPECT_EQ(static_cast<void*>(table), &g_table);
      EXPECT_EQ(g_table.references, 1 + callers);  // the module holds one
    }
  }
  EXPECT_EQ(g_table.references, 2u);
}

TEST_F(Module, GivesTheRegistryScriptsItsAppId) {
  const CQelShellExtModule module({});
  std::vector<Replacement> replacements;
  EXPECT_EQ(module.AddCommonRGSReplacements(replacements), S_OK);
  ASSERT_EQ(replacements.size(), 1u);
  EXPECT_EQ(replacements[0].name, L"APPID");
  EXPECT_EQ(replacements[0].value, L"{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
