// What the DLL does when the system tells it that it is loaded, that a thread comes or goes, and that it is
// unloaded: next to nothing, as the system holds the lock of its loader meanwhile.
#include <gtest/gtest.h>
#include <windows.h>

#include <map>
#include <set>
#include <string>

#include "import_patch.h"
#include "server_dll.h"
#include "unstarted_module.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// What the C++ runtime asks for when it starts and ends: memory, and from the environment how much of it;
/// its own locks, the classification of all characters, the streams of the console, a slot for exceptions,
/// and a random number for the protection of the stack.
const std::set<std::string> kRuntime = {
    "AcquireSRWLockExclusive",
    "GetCurrentProcessId",
    "GetCurrentThreadId",
    "GetLastError",
    "GetSystemTimeAsFileTime",
    "MultiByteToWideChar",
    "QueryPerformanceCounter",
    "ReleaseSRWLockExclusive",
    "SetLastError",
    "WakeAllConditionVariable",
    "WideCharToMultiByte",
    "___lc_codepage_func",
    "__iob_func",
    "_initterm",
    "_lock",
    "_unlock",
    "calloc",
    "fflush",
    "free",
    "getenv",
    "malloc",
    "strcmp",
};

using Calls = std::map<std::string, int>;

/// Without those of the runtime.
Calls OwnCalls(UnstartedModule& module) {
  Calls calls = module.TakeCalls();
  std::erase_if(calls, [](const auto& call) { return kRuntime.contains(call.first); });
  return calls;
}

class EntryPoint : public testing::Test {
 protected:
  UnstartedModule module_{ServerDll::Path()};
};

TEST_F(EntryPoint, MakesTwoLocksAndNothingElse) {
  EXPECT_EQ(OwnCalls(module_), Calls());  // not started yet
  EXPECT_TRUE(module_.Notify(DLL_PROCESS_ATTACH));
  EXPECT_EQ(OwnCalls(module_), (Calls{{"InitializeCriticalSectionAndSpinCount", 2}}));
  EXPECT_TRUE(module_.Notify(DLL_PROCESS_DETACH));
  EXPECT_EQ(OwnCalls(module_), (Calls{{"DeleteCriticalSection", 2}}));
}

TEST_F(EntryPoint, DoesNothingForThreads) {
  EXPECT_TRUE(module_.Notify(DLL_PROCESS_ATTACH));
  module_.TakeCalls();
  EXPECT_TRUE(module_.Notify(DLL_THREAD_ATTACH));
  EXPECT_TRUE(module_.Notify(DLL_THREAD_DETACH));
  EXPECT_EQ(module_.TakeCalls(), Calls());
  EXPECT_TRUE(module_.Notify(DLL_PROCESS_DETACH));
}

/// Which lock cannot be made, counted from 0, and the error that is given for it.
int g_failingSection = 0;
DWORD g_sectionError = ERROR_SUCCESS;

BOOL WINAPI MakeSection(CRITICAL_SECTION* section, DWORD spinCount) {
  if (g_failingSection-- != 0) return InitializeCriticalSectionAndSpinCount(section, spinCount);
  SetLastError(g_sectionError);
  return FALSE;
}

TEST_F(EntryPoint, RefusesToBeLoadedWithoutItsLocks) {
  const ImportPatch patch(module_.module(), "InitializeCriticalSectionAndSpinCount", &MakeSection);
  g_sectionError = ERROR_NOT_ENOUGH_MEMORY;
  for (const int section : {0, 1}) {
    g_failingSection = section;
    EXPECT_FALSE(module_.Notify(DLL_PROCESS_ATTACH));
  }
}

TEST_F(EntryPoint, TakesAFailureWithoutAnErrorForALock) {
  const ImportPatch patch(module_.module(), "InitializeCriticalSectionAndSpinCount", &MakeSection);
  g_sectionError = ERROR_SUCCESS;
  for (const int section : {0, 1}) {
    g_failingSection = section;
    EXPECT_TRUE(module_.Notify(DLL_PROCESS_ATTACH));
    EXPECT_TRUE(module_.Notify(DLL_PROCESS_DETACH));
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
