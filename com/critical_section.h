// A lock between the threads of the process whose creation can fail and says so.
#pragma once

#include <windows.h>

#include <synchapi.h>

namespace Qel::Com {

/// Meets the standard library's BasicLockable: std::lock_guard holds it.
class CriticalSection {
 public:
  CriticalSection() = default;
  ~CriticalSection();
  CriticalSection(const CriticalSection&) = delete;
  CriticalSection& operator=(const CriticalSection&) = delete;

  /// To be called once, before the first lock. A failure is the system's error as an HRESULT; one without
  /// an error code counts as success, and then there is nothing to lock.
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
