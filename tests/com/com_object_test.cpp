#include "com_object.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <type_traits>
#include <vector>

#include "allocation_meter.h"
#include "class_factory.h"
#include "import_patch.h"

namespace Qel::Com {
namespace {

using Lumetra::ShellExt::Testing::FailingHeap;
using Lumetra::ShellExt::Testing::ImportPatch;

class CountingModule : public Module {
 public:
  CountingModule() { MakeCurrent(this); }
  ~CountingModule() override { MakeCurrent(nullptr); }

  LONG Lock() override { return ++locks_; }
  LONG Unlock() override { return --locks_; }
  LONG GetLockCount() const override { return locks_; }
  HRESULT GetGITPtr(IGlobalInterfaceTable**) override { return E_NOTIMPL; }

 private:
  LONG locks_ = 0;
};

int g_alive = 0;
HRESULT g_finalResult = S_OK;
std::vector<LONG> g_locksInDestructor;

template <class Threading>
class Probe : public CComRoot<Threading, IPersistFile, IOleWindow> {
 public:
  Probe() : memory_(1) { ++g_alive; }

  HRESULT FinalConstruct() {
    // Taking and releasing a reference here must not destroy the object.
    this->AddRef();
    this->Release();
    return g_finalResult;
  }

  HRESULT STDMETHODCALLTYPE GetClassID(CLSID*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE IsDirty() override { return 11; }
  HRESULT STDMETHODCALLTYPE Load(LPCOLESTR, DWORD) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE Save(LPCOLESTR, BOOL) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE SaveCompleted(LPCOLESTR) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetCurFile(LPOLESTR*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetWindow(HWND*) override { return 12; }
  HRESULT STDMETHODCALLTYPE ContextSensitiveHelp(BOOL) override { return E_NOTIMPL; }

 protected:
  ~Probe() {
    --g_alive;
    g_locksInDestructor.push_back(Module::Current().GetLockCount());
  }

 private:
  std::vector<char> memory_;  // makes the constructor allocate
};

/// The outer object of an aggregate.
class Outer final : public IUnknown {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    if (iid != IID_IUnknown) return inner->QueryInterface(iid, object);
    *object = this;
    AddRef();
    return S_OK;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
  ULONG STDMETHODCALLTYPE Release() override { return --references; }

  ULONG references = 1;
  ComPtr<IUnknown> inner;
};

template <class Threading>
class ComObject : public testing::Test {
 protected:
  ComObject() {
    g_alive = 0;
    g_finalResult = S_OK;
    g_locksInDestructor.clear();
  }

  CountingModule module_;
};

using ThreadingModels = testing::Types<SingleThreaded, FreeThreaded>;
TYPED_TEST_SUITE(ComObject, ThreadingModels);

TYPED_TEST(ComObject, HasTheInterfacesInItsBaseList) {
  ComPtr<CComObject<Probe<TypeParam>>> object;
  ASSERT_EQ(MakeObject(object), S_OK);

  ComPtr<IUnknown> unknown;
  ComPtr<IPersistFile> first;
  ComPtr<IOleWindow> second;
  EXPECT_EQ(object->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(unknown.Put())), S_OK);
  EXPECT_EQ(object->QueryInterface(IID_IPersistFile, reinterpret_cast<void**>(first.Put())), S_OK);
  EXPECT_EQ(object->QueryInterface(IID_IOleWindow, reinterpret_cast<void**>(second.Put())), S_OK);
  EXPECT_EQ(unknown.Get(), first.Get());
  EXPECT_EQ(first->IsDirty(), 11);
  EXPECT_EQ(second->GetWindow(nullptr), 12);
}

TYPED_TEST(ComObject, RefusesBasesOfItsInterfaces) {
  ComPtr<CComObject<Probe<TypeParam>>> object;
  ASSERT_EQ(MakeObject(object), S_OK);
  void* answer = &answer;
  EXPECT_EQ(object->QueryInterface(IID_IPersist, &answer), E_NOINTERFACE);
  EXPECT_EQ(answer, nullptr);
  EXPECT_EQ(object->QueryInterface(IID_IUnknown, nullptr), E_POINTER);
}

TYPED_TEST(ComObject, KeepsTheModuleLoadedUntilItsDestructorIsDone) {
  {
    ComPtr<CComObject<Probe<TypeParam>>> object;
    ASSERT_EQ(MakeObject(object), S_OK);
    EXPECT_EQ(this->module_.GetLockCount(), 1);
  }
  EXPECT_EQ(g_alive, 0);
  EXPECT_EQ(g_locksInDestructor, std::vector<LONG>{1});
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

TYPED_TEST(ComObject, IsDestroyedWhenItsFinalConstructionFails) {
  g_finalResult = E_ACCESSDENIED;
  Outer outer;
  for (IUnknown* const aggregating : {static_cast<IUnknown*>(nullptr), static_cast<IUnknown*>(&outer)}) {
    void* answer = &answer;
    EXPECT_EQ(MakeInstance<Probe<TypeParam>>(aggregating, IID_IUnknown, &answer), E_ACCESSDENIED);
    EXPECT_EQ(answer, nullptr);
  }
  EXPECT_EQ(g_locksInDestructor, (std::vector<LONG>{1, 1}));
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

BOOL WINAPI NoSection(CRITICAL_SECTION*, DWORD) {
  SetLastError(ERROR_NOT_ENOUGH_MEMORY);
  return FALSE;
}
BOOL WINAPI NoSectionAndNoReason(CRITICAL_SECTION*, DWORD) {
  SetLastError(ERROR_SUCCESS);
  return FALSE;
}

TYPED_TEST(ComObject, IsDestroyedWhenItsLockCannotBeMade) {
  // An object for one thread has no lock whose creation could fail.
  const bool locks = std::is_same_v<TypeParam, FreeThreaded>;
  const ImportPatch none(GetModuleHandleW(nullptr), "InitializeCriticalSectionAndSpinCount", &NoSection);
  Outer outer;
  for (IUnknown* const aggregating : {static_cast<IUnknown*>(nullptr), static_cast<IUnknown*>(&outer)}) {
    ComPtr<IUnknown> made;
    EXPECT_EQ(MakeInstance<Probe<TypeParam>>(aggregating, IID_IUnknown, reinterpret_cast<void**>(made.Put())),
              locks ? HRESULT_FROM_WIN32(ERROR_NOT_ENOUGH_MEMORY) : S_OK);
    EXPECT_EQ(made.Get() == nullptr, locks);
  }
  EXPECT_EQ(g_alive, 0);
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

TYPED_TEST(ComObject, IgnoresAFailureOfItsLockThatSetsNoError) {
  const ImportPatch none(GetModuleHandleW(nullptr), "InitializeCriticalSectionAndSpinCount",
                         &NoSectionAndNoReason);
  ComPtr<CComObject<Probe<TypeParam>>> object;
  EXPECT_EQ(MakeObject(object), S_OK);
}

std::vector<void*> g_entered;

void WINAPI EnterSection(CRITICAL_SECTION* section) {
  g_entered.push_back(section);
}
void WINAPI LeaveSection(CRITICAL_SECTION*) {}

TEST(CriticalSection, IsNotEnteredWhenItsCreationFailedWithoutAnError) {
  const HMODULE program = GetModuleHandleW(nullptr);
  CriticalSection section;
  {
    const ImportPatch none(program, "InitializeCriticalSectionAndSpinCount", &NoSectionAndNoReason);
    EXPECT_EQ(section.Create(), S_OK);
  }
  const auto entered = [&section, program] {
    g_entered.clear();
    g_entered.reserve(16);
    const ImportPatch enter(program, "EnterCriticalSection", &EnterSection);
    const ImportPatch leave(program, "LeaveCriticalSection", &LeaveSection);
    section.lock();
    section.unlock();
    return std::ranges::count(g_entered, static_cast<void*>(&section));
  };
  EXPECT_EQ(entered(), 0);
  EXPECT_EQ(section.Create(), S_OK);
  EXPECT_EQ(entered(), 1);
}

TYPED_TEST(ComObject, IsNotMadeWithoutMemory) {
  Outer outer;
  for (IUnknown* const aggregating : {static_cast<IUnknown*>(nullptr), static_cast<IUnknown*>(&outer)}) {
    for (const int allocation : {0, 1}) {  // the object, then the memory of its constructor
      void* answer = &answer;
      HRESULT result = S_OK;
      {
        const FailingHeap heap(allocation, FailingHeap::Then::kKeepsFailing);
        result = MakeInstance<Probe<TypeParam>>(aggregating, IID_IUnknown, &answer);
      }
      EXPECT_EQ(result, E_OUTOFMEMORY);
      EXPECT_EQ(answer, nullptr);
    }
  }
  EXPECT_TRUE(g_locksInDestructor.empty());
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

TYPED_TEST(ComObject, IsDestroyedWhenItLacksTheInterface) {
  void* answer = &answer;
  EXPECT_EQ(MakeInstance<Probe<TypeParam>>(nullptr, IID_IPersist, &answer), E_NOINTERFACE);
  EXPECT_EQ(answer, nullptr);
  EXPECT_EQ(MakeInstance<Probe<TypeParam>>(nullptr, IID_IUnknown, nullptr), E_POINTER);
  EXPECT_EQ(g_alive, 0);
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

TYPED_TEST(ComObject, BelongsToTheObjectThatAggregatesIt) {
  Outer outer;
  ASSERT_EQ(MakeInstance<Probe<TypeParam>>(&outer, IID_IUnknown, reinterpret_cast<void**>(outer.inner.Put())),
            S_OK);
  EXPECT_EQ(this->module_.GetLockCount(), 1);
  EXPECT_EQ(outer.references, 1u);
  {
    ComPtr<IOleWindow> window;
    ASSERT_EQ(outer.QueryInterface(IID_IOleWindow, reinterpret_cast<void**>(window.Put())), S_OK);
    EXPECT_EQ(outer.references, 2u);
    EXPECT_EQ(window->GetWindow(nullptr), 12);

    ComPtr<IUnknown> identity;
    ASSERT_EQ(window->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(identity.Put())), S_OK);
    EXPECT_EQ(identity.Get(), &outer);

    ComPtr<IUnknown> inner;
    ASSERT_EQ(outer.inner->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(inner.Put())), S_OK);
    EXPECT_EQ(inner.Get(), outer.inner.Get());
    EXPECT_EQ(outer.inner->QueryInterface(IID_IUnknown, nullptr), E_POINTER);
  }
  EXPECT_EQ(outer.references, 1u);
  EXPECT_EQ(g_alive, 1);
  outer.inner = {};
  EXPECT_EQ(g_locksInDestructor, std::vector<LONG>{1});
  EXPECT_EQ(this->module_.GetLockCount(), 0);
}

TYPED_TEST(ComObject, IsMadeByTheFactoryOfItsClass) {
  ComPtr<IClassFactory> factory;
  ASSERT_EQ(MakeClassFactory(&MakeInstance<Probe<TypeParam>>, IID_IClassFactory,
                             reinterpret_cast<void**>(factory.Put())),
            S_OK);
  ComPtr<IOleWindow> window;
  EXPECT_EQ(factory->CreateInstance(nullptr, IID_IOleWindow, reinterpret_cast<void**>(window.Put())), S_OK);
  EXPECT_EQ(window->GetWindow(nullptr), 12);

  Outer outer;
  void* answer = &answer;
  EXPECT_EQ(factory->CreateInstance(&outer, IID_IOleWindow, &answer), CLASS_E_NOAGGREGATION);
  EXPECT_EQ(answer, nullptr);
  EXPECT_EQ(factory->CreateInstance(&outer, IID_IOleWindow, nullptr), E_POINTER);
  EXPECT_EQ(g_alive, 1);
}

TEST(ComPtr, ReleasesItsObjectBeforeItTakesAnother) {
  Outer first;
  Outer second;
  ComPtr<IUnknown> pointer(&first);
  EXPECT_EQ(first.references, 2u);
  IUnknown** const place = pointer.Put();
  EXPECT_EQ(first.references, 1u);
  EXPECT_EQ(*place, nullptr);
  second.AddRef();
  *place = &second;
  EXPECT_EQ(pointer.Get(), &second);
  pointer = {};
  EXPECT_EQ(second.references, 1u);
}

TEST(CachedFactory, KeepsTheModuleLoadedFromItsSecondReferenceOn) {
  const CountingModule module;
  ComPtr<IClassFactory> cached;
  ASSERT_EQ(MakeClassFactory(nullptr, IID_IClassFactory, reinterpret_cast<void**>(cached.Put())), S_OK);
  EXPECT_EQ(module.GetLockCount(), 0);
  {
    const ComPtr<IClassFactory> second = cached;
    EXPECT_EQ(module.GetLockCount(), 1);
    const ComPtr<IClassFactory> third = second;
    EXPECT_EQ(module.GetLockCount(), 1);
  }
  EXPECT_EQ(module.GetLockCount(), 0);
  cached = {};
  EXPECT_EQ(module.GetLockCount(), 0);
}

}  // namespace
}  // namespace Qel::Com
