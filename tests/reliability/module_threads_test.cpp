// Tests what the threads of a process share: the module's lock count, its class objects, and free-threaded
// objects. The test is native, so that it can be built with ThreadSanitizer too (preset linux-tsan).
// class_objects_test does the same with the DLL.
#include <gtest/gtest.h>

#include <array>
#include <atomic>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

#include "com_object.h"
#include "com_ptr.h"
#include "qel_shell_ext_module.h"

namespace Qel::Lumetra::ShellExt::Testing {

struct ICounter : IUnknown {
  /// Increments the count under the object's own lock, and returns it.
  virtual int Count() = 0;

 protected:
  ~ICounter() = default;
};

constexpr IID kCounterId = {0x12345678, 0x1234, 0x1234, {1, 2, 3, 4, 5, 6, 7, 8}};

}  // namespace Qel::Lumetra::ShellExt::Testing

template <>
inline constexpr IID Qel::Com::kInterfaceId<Qel::Lumetra::ShellExt::Testing::ICounter> =
    Qel::Lumetra::ShellExt::Testing::kCounterId;

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

using Com::ComPtr;

constexpr std::size_t kThreads = 8;
constexpr int kRounds = 20;

std::atomic<int> g_alive = 0;

class Counter : public Com::CComRoot<Com::FreeThreaded, ICounter> {
 public:
  Counter() { ++g_alive; }

  int Count() override {
    const std::lock_guard guard(section());
    return ++count_;
  }

 protected:
  ~Counter() { --g_alive; }

 private:
  int count_ = 0;
};

/// Gives other threads the chance to run in the middle of an operation, which must not harm it.
void Dawdle() {
  for (int i = 0; i < 5; ++i) std::this_thread::yield();
}

std::atomic<int> g_madeClassObjects = 0;

HRESULT MakeClassFactorySlowly(Com::InstanceMaker makeInstance, REFIID iid, void** classObject) {
  ++g_madeClassObjects;
  Dawdle();
  return Com::MakeClassFactory(makeInstance, iid, classObject);
}

class SlowModule : public CQelShellExtModule {
 public:
  using CQelShellExtModule::CQelShellExtModule;

  LONG Lock() override {
    Dawdle();
    return CQelShellExtModule::Lock();
  }
};

/// Runs `work` in all threads, which start it at the same time.
void RunInThreads(const std::function<void(std::size_t thread)>& work) {
  std::atomic<bool> go = false;
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < kThreads; ++i) {
    threads.emplace_back([&, i] {
      while (!go) std::this_thread::yield();
      work(i);
    });
  }
  go = true;
  for (std::thread& thread : threads) thread.join();
}

class ModuleThreads : public testing::Test {
 protected:
  ~ModuleThreads() override {
    EXPECT_EQ(module_.GetLockCount(), 0);
    EXPECT_EQ(g_alive, 0);
  }

  ComPtr<IClassFactory> Factory() {
    ComPtr<IClassFactory> factory;
    EXPECT_EQ(module_.GetClassObject(kClass, IID_IClassFactory, reinterpret_cast<void**>(factory.Put())),
              S_OK);
    return factory;
  }

  template <class Interface>
  static ComPtr<Interface> Make(const ComPtr<IClassFactory>& factory, IUnknown* outer, REFIID iid) {
    ComPtr<Interface> object;
    EXPECT_EQ(factory->CreateInstance(outer, iid, reinterpret_cast<void**>(object.Put())), S_OK);
    return object;
  }

  static constexpr CLSID kClass = {0x12345678, 0x1234, 0x1234, {1, 2, 3, 4, 5, 6, 7, 9}};

  std::array<ObjectMapEntry, 1> map_{{{&kClass, 0, &MakeClassFactorySlowly, &Com::MakeInstance<Counter>}}};
  SlowModule module_{map_};
};

TEST_F(ModuleThreads, GetTheSameClassObject) {
  g_madeClassObjects = 0;
  std::array<ComPtr<IClassFactory>, kThreads> factories;
  RunInThreads([&](std::size_t thread) { factories[thread] = Factory(); });
  EXPECT_EQ(g_madeClassObjects, 1);
  for (const auto& factory : factories) EXPECT_EQ(factory.Get(), factories[0].Get());
  EXPECT_EQ(module_.GetLockCount(), 1);
}

TEST_F(ModuleThreads, KeepTheModuleLoadedByEveryReferenceToAClassObject) {
  RunInThreads([&](std::size_t) {
    for (int i = 0; i < kRounds; ++i) {
      const auto factory = Factory();
      EXPECT_GE(module_.GetLockCount(), 1);
    }
  });
}

TEST_F(ModuleThreads, MakeAndReleaseObjectsOfTheirOwn) {
  RunInThreads([&](std::size_t) {
    for (int i = 0; i < kRounds; ++i) {
      const auto factory = Factory();
      EXPECT_EQ(Make<ICounter>(factory, nullptr, kCounterId)->Count(), 1);
      // An aggregated object is released through its own IUnknown. Its outer object is not called.
      const auto outer = Make<IUnknown>(factory, nullptr, IID_IUnknown);
      EXPECT_TRUE(Make<IUnknown>(factory, outer.Get(), IID_IUnknown));
    }
  });
}

TEST_F(ModuleThreads, LockAndUnlockTheServer) {
  RunInThreads([&](std::size_t) {
    for (int i = 0; i < kRounds; ++i) {
      const auto factory = Factory();
      factory->LockServer(TRUE);
      EXPECT_GE(module_.GetLockCount(), 2);
      factory->LockServer(FALSE);
    }
  });
}

TEST_F(ModuleThreads, AskForTheInterfaceTable) {
  RunInThreads([&](std::size_t) {
    IGlobalInterfaceTable* table = nullptr;
    EXPECT_EQ(module_.GetGITPtr(&table),
              REGDB_E_CLASSNOTREG);  // there are no registered classes in this process
  });
}

TEST_F(ModuleThreads, ShareAnObjectThatTheLastReferenceDeletes) {
  for (int round = 0; round < kRounds; ++round) {
    std::array<ComPtr<ICounter>, kThreads> references;
    references.fill(Make<ICounter>(Factory(), nullptr, kCounterId));
    std::atomic<int> sum = 0;
    RunInThreads([&](std::size_t thread) {
      const ComPtr<ICounter> another = references[thread];
      sum += another->Count();
      references[thread] = {};
    });
    EXPECT_EQ(sum, static_cast<int>(kThreads * (kThreads + 1) / 2));
    EXPECT_EQ(g_alive, 0);
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
