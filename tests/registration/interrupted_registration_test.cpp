// Makes a registration fail or die at each of its changes to the registry, and checks that the next
// registration or unregistration repairs the result.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <cstddef>
#include <functional>
#include <string>
#include <utility>

#include "dll_registration.h"
#include "expected_registration.h"
#include "import_patch.h"
#include "registry_reader.h"
#include "registry_writes.h"
#include "same_contents.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// How often the DLL has notified the shell.
int g_notifications = 0;

void WINAPI CountNotification(LONG, UINT, const void*, const void*) {
  ++g_notifications;
}

/// A call that can be abandoned, as if its process were killed: no more of its code runs, not even a
/// destructor, and its handles stay open. It runs on a fiber of its own, whose stack is freed afterwards.
class AbandonableCall {
 public:
  explicit AbandonableCall(std::function<void()> call)
      : call_(std::move(call)),
        caller_(ConvertThreadToFiber(nullptr)),
        fiber_(CreateFiber(0, &Start, this)) {}

  ~AbandonableCall() {
    DeleteFiber(fiber_);
    ConvertFiberToThread();
  }

  AbandonableCall(const AbandonableCall&) = delete;
  AbandonableCall& operator=(const AbandonableCall&) = delete;

  /// Returns whether the call has returned.
  bool Run() {
    const LCID locale = GetThreadLocale();
    SwitchToFiber(fiber_);
    SetThreadLocale(locale);  // a killed process would lose the call's locale
    return isDone_;
  }

  /// Ends the call from inside. Does not return.
  void Abandon() { SwitchToFiber(caller_); }

 private:
  static void WINAPI Start(void* self) {
    auto& call = *static_cast<AbandonableCall*>(self);
    call.call_();
    call.isDone_ = true;
    SwitchToFiber(call.caller_);
  }

  std::function<void()> call_;
  bool isDone_ = false;
  void* caller_;
  void* fiber_;
};

class InterruptedRegistration : public ::testing::Test {
 protected:
  using EntryPoint = HRESULT (DllRegistration::*)() const;

  enum class End { kFailure, kDeath };

  /// Interrupts a registration at every change, twice: first unregistering must clean up after it, then
  /// registering again must repair it.
  void InterruptEveryRegistration(End end) {
    const std::size_t changes = CountChanges(&DllRegistration::Register);
    ASSERT_GT(changes, 250u);
    for (std::size_t i = 0; i < changes && !HasFailure(); ++i) {
      SCOPED_TRACE("change " + std::to_string(i));
      registry_.Clear();
      Interrupt(end, &DllRegistration::Register, i);
      ExpectUnregisteringCleansUp();
      Interrupt(end, &DllRegistration::Register, i);
      ASSERT_EQ(server_.Register(), S_OK);
      EXPECT_TRUE(Same(registry_.Contents(), complete_));
    }
  }

  void InterruptEveryUnregistration(End end) {
    ASSERT_EQ(server_.Register(), S_OK);
    const std::size_t changes = CountChanges(&DllRegistration::Unregister);
    ASSERT_GT(changes, 50u);
    for (std::size_t i = 0; i < changes && !HasFailure(); ++i) {
      SCOPED_TRACE("change " + std::to_string(i));
      ASSERT_EQ(server_.Register(), S_OK);
      Interrupt(end, &DllRegistration::Unregister, i);
      ExpectUnregisteringCleansUp();
    }
  }

 private:
  std::size_t CountChanges(EntryPoint entryPoint) {
    const RegistryWrites writes(server_.module(), [](std::size_t) -> LSTATUS { return ERROR_SUCCESS; });
    EXPECT_EQ((server_.*entryPoint)(), S_OK);
    return writes.count();
  }

  /// Calls `entryPoint` and ends it at the change with index `number`. No further change may follow.
  void Interrupt(End end, EntryPoint entryPoint, std::size_t number) {
    AbandonableCall call([&] { EXPECT_EQ((server_.*entryPoint)(), E_ACCESSDENIED); });
    const RegistryWrites writes(server_.module(), [&](std::size_t change) -> LSTATUS {
      if (change != number) return ERROR_SUCCESS;
      if (end == End::kDeath) call.Abandon();
      return ERROR_ACCESS_DENIED;
    });
    g_notifications = 0;
    EXPECT_EQ(call.Run(), end == End::kFailure);
    EXPECT_EQ(writes.count(), number + 1);
    EXPECT_EQ(g_notifications, 0);
  }

  void ExpectUnregisteringCleansUp() {
    ASSERT_EQ(server_.Unregister(), S_OK);
    EXPECT_EQ(Without(registry_.Contents(), leftOver_), RegistryContents{});
  }

  const RegistryContents complete_ = ExpectedAfterRegistering(ServerDll::Path());
  const RegistryContents leftOver_ = ExpectedAfterUnregistering();
  PrivateRegistry registry_;
  DllRegistration server_;
  const ImportPatch notify_{server_.module(), "SHChangeNotify", &CountNotification};
};

TEST_F(InterruptedRegistration, IsRepairedOrCleanedUpAfterAFailure) {
  InterruptEveryRegistration(End::kFailure);
}

TEST_F(InterruptedRegistration, IsRepairedOrCleanedUpAfterADeath) {
  InterruptEveryRegistration(End::kDeath);
}

TEST_F(InterruptedRegistration, IsCompletedByUnregisteringAfterAFailure) {
  InterruptEveryUnregistration(End::kFailure);
}

TEST_F(InterruptedRegistration, IsCompletedByUnregisteringAfterADeath) {
  InterruptEveryUnregistration(End::kDeath);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
