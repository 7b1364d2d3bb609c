#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>

#include <array>
#include <atomic>
#include <thread>
#include <vector>

#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

struct CreatableClass {
  CLSID clsid;
  IID otherInterface;  // another interface of the class besides IUnknown
};

const CreatableClass kClasses[] = {
    {kShellExtClass, IID_IExtractImage},
    {kEbnHandlerClass, IID_IPropertyStore},
    {kRawHandlerClass, IID_IPropertyStore},
    {kMrcHandlerClass, IID_IPropertyStore},
};

using ClassObjects = ServerTest;

TEST_F(ClassObjects, RequireAnOutputPointer) {
  EXPECT_EQ(dll_.GetClassObject(kShellExtClass, IID_IClassFactory, nullptr), E_POINTER);
}

TEST_F(ClassObjects, AreRefusedForHandlersThatTheServerDoesNotImplement) {
  for (const wchar_t* const handler :
       {L"{F9ADF69F-20BB-45A6-ABE6-D833AD51D6AE}", L"{FEB98CE0-7F8B-46ED-940E-057F56AE3806}",
        L"{F903650A-F2FF-4B8F-8648-E7D8D00D69C7}", L"{DF388BD2-0855-4D1A-9E9A-05F6A13DBC81}"}) {
    CLSID clsid{};
    ASSERT_EQ(CLSIDFromString(handler, &clsid), S_OK);
    void* answer = &answer;
    EXPECT_EQ(dll_.GetClassObject(clsid, IID_IClassFactory, &answer), CLASS_E_CLASSNOTAVAILABLE);
    EXPECT_EQ(answer, nullptr);
  }
}

TEST_F(ClassObjects, AreRefusedForAClsidThatDiffersInOneWordOnly) {
  for (std::size_t byte = 0; byte < sizeof(CLSID); byte += 4) {
    CLSID clsid = kShellExtClass;
    reinterpret_cast<unsigned char*>(&clsid)[byte] ^= 1;
    void* answer = &answer;
    EXPECT_EQ(dll_.GetClassObject(clsid, IID_IUnknown, &answer), CLASS_E_CLASSNOTAVAILABLE);
    EXPECT_EQ(answer, nullptr) << byte;
  }
}

TEST_F(ClassObjects, AreFactoriesAndNothingElse) {
  for (const CreatableClass& creatable : kClasses) {
    ComPtr<IUnknown> unknown;
    ASSERT_EQ(dll_.GetClassObject(creatable.clsid, IID_IUnknown, reinterpret_cast<void**>(unknown.Put())),
              S_OK);
    EXPECT_EQ(unknown.Get(), dll_.Factory(creatable.clsid).Get());
    void* answer = &answer;
    EXPECT_EQ(dll_.GetClassObject(creatable.clsid, creatable.otherInterface, &answer), E_NOINTERFACE);
    EXPECT_EQ(answer, nullptr);
    EXPECT_EQ(unknown->QueryInterface(IID_IUnknown, nullptr), E_POINTER);
  }
}

TEST_F(ClassObjects, AreKeptButDoNotKeepTheServerLoaded) {
  for (const CreatableClass& creatable : kClasses) {
    IClassFactory* first = nullptr;
    {
      const ComPtr<IClassFactory> factory = dll_.Factory(creatable.clsid);
      first = factory.Get();
      EXPECT_EQ(References(factory), 1u);  // held by the module
      EXPECT_EQ(dll_.CanUnloadNow(), S_FALSE);
    }
    EXPECT_EQ(dll_.CanUnloadNow(), S_OK);
    EXPECT_EQ(dll_.Factory(creatable.clsid).Get(), first);
  }
}

TEST_F(ClassObjects, LockTheServerOnceHoweverManyReferencesThereAre) {
  const ComPtr<IClassFactory> first = dll_.Factory(kShellExtClass);
  EXPECT_EQ(dll_.LockCount(), 1);
  {
    const ComPtr<IClassFactory> second = dll_.Factory(kShellExtClass);
    const ComPtr<IClassFactory> third = second;
    EXPECT_EQ(References(first), 3u);
    EXPECT_EQ(dll_.LockCount(), 1);
  }
  EXPECT_EQ(dll_.LockCount(), 1);
}

TEST_F(ClassObjects, LockServerCounts) {
  const ComPtr<IClassFactory> factory = dll_.Factory(kShellExtClass);
  EXPECT_EQ(factory->LockServer(TRUE), S_OK);
  EXPECT_EQ(factory->LockServer(2), S_OK);
  EXPECT_EQ(dll_.LockCount(), 3);
  EXPECT_EQ(factory->LockServer(FALSE), S_OK);
  EXPECT_EQ(dll_.LockCount(), 2);
  EXPECT_EQ(factory->LockServer(FALSE), S_OK);
  EXPECT_EQ(dll_.LockCount(), 1);
}

TEST_F(ClassObjects, MakeObjectsThatKeepTheServerLoaded) {
  for (const CreatableClass& creatable : kClasses) {
    auto first = dll_.CreateInstance<IUnknown>(creatable.clsid, IID_IUnknown);
    EXPECT_EQ(dll_.LockCount(), 1);
    auto second = dll_.CreateInstance<IUnknown>(creatable.clsid, creatable.otherInterface);
    EXPECT_EQ(dll_.LockCount(), 2);
    EXPECT_NE(first.Get(), second.Get());
    {
      const ComPtr<IUnknown> more = first;
      EXPECT_EQ(References(first), 1u);
      EXPECT_EQ(dll_.LockCount(), 2);
    }
    EXPECT_EQ(References(first), 0u);
    first = {};
    EXPECT_EQ(dll_.LockCount(), 1);
    second = {};
    EXPECT_EQ(dll_.LockCount(), 0);
  }
}

TEST_F(ClassObjects, MakeNothingWithoutAnOutputPointer) {
  OuterObject outer;
  for (const CreatableClass& creatable : kClasses) {
    const ComPtr<IClassFactory> factory = dll_.Factory(creatable.clsid);
    EXPECT_EQ(factory->CreateInstance(nullptr, IID_IUnknown, nullptr), E_POINTER);
    EXPECT_EQ(factory->CreateInstance(&outer, IID_IExtractImage, nullptr), E_POINTER);
    EXPECT_EQ(dll_.LockCount(), 1);
  }
}

TEST_F(ClassObjects, MakeNothingThatLacksTheInterface) {
  for (const CreatableClass& creatable : kClasses) {
    const ComPtr<IClassFactory> factory = dll_.Factory(creatable.clsid);
    void* answer = &answer;
    EXPECT_EQ(factory->CreateInstance(nullptr, IID_IClassFactory, &answer), E_NOINTERFACE);
    EXPECT_EQ(answer, nullptr);
    EXPECT_EQ(dll_.LockCount(), 1);
  }
}

TEST_F(ClassObjects, AggregateForIUnknownOnly) {
  OuterObject outer;
  for (const CreatableClass& creatable : kClasses) {
    const ComPtr<IClassFactory> factory = dll_.Factory(creatable.clsid);
    void* answer = &answer;
    EXPECT_EQ(factory->CreateInstance(&outer, creatable.otherInterface, &answer), CLASS_E_NOAGGREGATION);
    EXPECT_EQ(answer, nullptr);
    EXPECT_EQ(outer.references(), 1u);
    EXPECT_EQ(dll_.LockCount(), 1);
  }
}

TEST_F(ClassObjects, AggregatedObjectsBelongToTheirOuterObject) {
  for (const CreatableClass& creatable : kClasses) {
    OuterObject outer;
    outer.inner = dll_.CreateInstance<IUnknown>(creatable.clsid, IID_IUnknown, &outer);
    ASSERT_TRUE(outer.inner);
    EXPECT_NE(outer.inner.Get(), &outer);
    EXPECT_EQ(dll_.LockCount(), 1);
    EXPECT_EQ(outer.references(), 1u);
    {
      // The inner object's IUnknown counts references to the inner object, its other interfaces to the outer
      // one.
      const auto same = As<IUnknown>(outer.inner, IID_IUnknown);
      EXPECT_EQ(same.Get(), outer.inner.Get());
      EXPECT_EQ(References(outer.inner), 1u);
      EXPECT_EQ(outer.references(), 1u);

      const auto inner = As<IUnknown>(outer.inner, creatable.otherInterface);
      EXPECT_EQ(outer.references(), 2u);
      EXPECT_EQ(References(outer.inner), 1u);
      const auto identity = As<IUnknown>(inner, IID_IUnknown);
      EXPECT_EQ(identity.Get(), &outer);
      EXPECT_EQ(As<IUnknown>(inner, creatable.otherInterface).Get(), inner.Get());
      EXPECT_EQ(outer.references(), 3u);
    }
    EXPECT_EQ(outer.references(), 1u);
    outer.inner = {};
    EXPECT_EQ(dll_.LockCount(), 0);
  }
}

TEST_F(ClassObjects, MakeObjectsInManyThreads) {
  std::vector<std::thread> threads;
  for (int i = 0; i < 64; ++i) {
    threads.emplace_back([&] {
      for (int round = 0; round < 50; ++round) {
        for (const CreatableClass& creatable : kClasses) {
          EXPECT_EQ(References(dll_.CreateInstance<IUnknown>(creatable.clsid, creatable.otherInterface)), 0u);
          OuterObject outer;
          outer.inner = dll_.CreateInstance<IUnknown>(creatable.clsid, IID_IUnknown, &outer);
          EXPECT_EQ(References(As<IUnknown>(outer.inner, creatable.otherInterface)), 1u);
        }
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(dll_.LockCount(), 0);
}

TEST(ClassObjectsOfAFreshServer, AreTheSameForAllThreadsThatAskAtOnce) {
  constexpr std::size_t kThreads = 16;
  for (int round = 0; round < 5; ++round) {
    for (const CreatableClass& creatable : kClasses) {
      ASSERT_EQ(GetModuleHandleW(L"QelShellExt.dll"), nullptr);
      const ServerDll dll;
      std::array<ComPtr<IClassFactory>, kThreads> factories;
      std::atomic<bool> go = false;
      std::vector<std::thread> threads;
      for (auto& factory : factories) {
        threads.emplace_back([&] {
          while (!go) std::this_thread::yield();
          factory = dll.Factory(creatable.clsid);
        });
      }
      go = true;
      for (std::thread& thread : threads) thread.join();
      for (const auto& factory : factories) EXPECT_EQ(factory.Get(), factories[0].Get());
      EXPECT_EQ(References(factories[0]), kThreads);
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
