// Tests the release DLL in a process without free thread-local and fiber-local slots. The exceptions of
// readers must still reach their caller, in every thread.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <filesystem>
#include <latch>
#include <stdexcept>
#include <thread>
#include <vector>

#include "emi_file.h"
#include "server_dll.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// Allocates every free slot of the process, and frees them when it is destroyed.
template <auto kAllocate, auto kFree>
class AllSlots {
 public:
  AllSlots() {
    for (DWORD slot = kAllocate(); slot != TLS_OUT_OF_INDEXES; slot = kAllocate()) slots_.push_back(slot);
  }
  ~AllSlots() {
    for (const DWORD slot : slots_) kFree(slot);
  }
  AllSlots(const AllSlots&) = delete;
  AllSlots& operator=(const AllSlots&) = delete;

 private:
  std::vector<DWORD> slots_;
};

DWORD AllocateFiberSlot() {
  return FlsAlloc(nullptr);
}

class ExhaustedProcess : public testing::Test {
 protected:
  ExhaustedProcess() {
    // A pixel array outside every image, for which the reader throws an exception.
    EmiFile emi;
    emi.items = EmiArray(0x2202, 0x0202, "a pixel array outside any image");
    path_ = folder_.Write("throwing.emi", emi.Bytes());
    // After its first exception, this program's own runtime needs no further slot.
    EXPECT_THROW(throw std::runtime_error("first"), std::runtime_error);
  }

  /// Loads the file into a new object. Throws the reader's exception.
  void Load(const ServerDll& dll) const {
    const auto file = dll.CreateInstance<IPersistFile>(kShellExtClass, IID_IPersistFile);
    file->Load(path_.c_str(), STGM_READ);
  }

  TempFolder folder_;
  std::filesystem::path path_;
};

TEST_F(ExhaustedProcess, GetsTheExceptionsOfReaders) {
  // This program imports from the same system modules, so loading the DLL now loads nothing else.
  const AllSlots<&TlsAlloc, &TlsFree> threadSlots;
  const AllSlots<&AllocateFiberSlot, &FlsFree> fiberSlots;
  const ServerDll dll;
  EXPECT_THROW(Load(dll), std::invalid_argument);
  EXPECT_THROW(Load(dll), std::invalid_argument);
  std::thread([&] { EXPECT_THROW(Load(dll), std::invalid_argument); }).join();
}

TEST_F(ExhaustedProcess, GetsTheExceptionsOfManyThreadsAtOnce) {
  constexpr int kThreads = 200;
  const ServerDll dll;
  std::latch everyThreadHasOne(kThreads);
  std::vector<std::thread> threads;
  for (int i = 0; i < kThreads; ++i) {
    threads.emplace_back([&] {
      try {
        Load(dll);
        ADD_FAILURE() << "no exception was thrown";
        everyThreadHasOne.count_down();
      } catch (const std::invalid_argument& e) {
        everyThreadHasOne.arrive_and_wait();
        EXPECT_STREQ(e.what(), "bad EMI object index");
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
