// A lock for the threads of the process. Its creation can fail, which Create reports.
#pragma once

#include <windows.h>

#include <synchapi.h>

namespace Qel::Com {

/// Meets the BasicLockable requirements of the standard library, so that std::lock_guard can hold it.
class CriticalSection {
 public:
  CriticalSection() = default;
  ~CriticalSection();
  CriticalSection(const CriticalSection&) = delete;
  CriticalSection& operator=(const CriticalSection&) = delete;

  /// Creates the lock. Must be called once, before it is used. Returns the system's error as an HRESULT. A
  /// failure for which the system sets no error code counts as success; locking then does nothing.
  HRESULT Create();

  void lock() {
    if (created_) EnterCriticalSection(&section_);
  }
  void unlock() {
    if (created_) LeaveCriticalSection(&section_);
  }

 private:
  CRITICAL_SECTION section_{};
  bool created_ = false;
};

}  // namespace Qel::Com
