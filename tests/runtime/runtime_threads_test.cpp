// Tests the DLL's own POSIX thread functions. They have other names here (tests/CMakeLists.txt), because this
// program links a library with the same names.
#include <gtest/gtest.h>
#include <pthread.h>
#include <windows.h>

#include <thread>

#include "import_patch.h"

// NOLINTBEGIN(readability-identifier-naming): the build derives these names from those of the C library
extern "C" {
int guest_pthread_once(pthread_once_t* once, void (*run)());
int guest_pthread_mutex_lock(pthread_mutex_t*);
int guest_pthread_mutex_unlock(pthread_mutex_t*);
}
// NOLINTEND(readability-identifier-naming)

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

int g_runs = 0;
HANDLE g_started = nullptr;
HANDLE g_mayEnd = nullptr;
decltype(&SleepConditionVariableSRW) g_sleep = nullptr;

void RunSlowly() {
  ++g_runs;
  SetEvent(g_started);
  WaitForSingleObject(g_mayEnd, INFINITE);
}

/// Signals that a thread is about to wait. The thread holds the lock until it sleeps, so no wake-up can be
/// missed.
BOOL WINAPI SayAndSleep(PCONDITION_VARIABLE condition, PSRWLOCK lock, DWORD milliseconds, ULONG flags) {
  SetEvent(g_mayEnd);
  return g_sleep(condition, lock, milliseconds, flags);
}

TEST(RuntimeThreads, OnceWakesTheThreadsThatWaitForItsEnd) {
  g_sleep = &SleepConditionVariableSRW;  // the original: the next line replaces the import
  const ImportPatch sleep(GetModuleHandleW(nullptr), "SleepConditionVariableSRW", &SayAndSleep);
  g_started = CreateEventW(nullptr, TRUE, FALSE, nullptr);
  g_mayEnd = CreateEventW(nullptr, TRUE, FALSE, nullptr);
  static pthread_once_t once = PTHREAD_ONCE_INIT;
  const auto callOnce = [](void*) -> DWORD WINAPI {
    guest_pthread_once(&once, &RunSlowly);
    return 0;
  };
  const HANDLE first = CreateThread(nullptr, 0, callOnce, nullptr, 0, nullptr);
  WaitForSingleObject(g_started, INFINITE);
  const HANDLE second = CreateThread(nullptr, 0, callOnce, nullptr, 0, nullptr);
  EXPECT_EQ(WaitForSingleObject(first, INFINITE), WAIT_OBJECT_0);
  constexpr DWORD kForever = 60'000;
  ASSERT_EQ(WaitForSingleObject(second, kForever), WAIT_OBJECT_0);
  EXPECT_EQ(g_runs, 1);
  guest_pthread_once(&once, &RunSlowly);
  EXPECT_EQ(g_runs, 1);
  for (const HANDLE handle : {first, second, g_started, g_mayEnd}) CloseHandle(handle);
}

TEST(RuntimeThreads, LockKeepsOtherThreadsOutUntilItsLastUnlock) {
  constexpr int kRounds = 10'000;
  int count = 0;
  const auto work = [&count] {
    for (int i = 0; i < kRounds; ++i) {
      guest_pthread_mutex_lock(nullptr);
      guest_pthread_mutex_lock(nullptr);
      guest_pthread_mutex_unlock(nullptr);
      const int before = *const_cast<volatile int*>(&count);
      *const_cast<volatile int*>(&count) = before + 1;
      guest_pthread_mutex_unlock(nullptr);
    }
  };
  std::thread one(work);
  std::thread two(work);
  one.join();
  two.join();
  EXPECT_EQ(count, 2 * kRounds);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
