// Tests what the DLL calls when the system loads and unloads it, and when a thread starts or ends. It must
// call next to nothing, because the system holds the loader lock meanwhile.
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

/// What the C++ runtime calls when it starts and ends: memory, and the environment variable that sets its
/// pool of memory; its own locks, the character classification, the console streams, a slot for exceptions,
/// and a random number for the stack guard.
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

/// Returns the calls of the DLL without those of the C++ runtime.
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
  EXPECT_EQ(OwnCalls(module_), Calls());  // the DLL has not started yet
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

/// The index, from 0, of the lock whose creation fails, and the error that the failure sets.
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

TEST_F(EntryPoint, IgnoresAFailureOfALockThatSetsNoError) {
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
