// The two ways in which an object lives with threads: what its reference count is made of, and the lock
// that each object brings along. CComRoot takes one of them as its first argument.
#pragma once

#include <windows.h>

#include <atomic>

#include "critical_section.h"

namespace Qel::Com {

/// For classes registered "Apartment": one thread at a time, nothing is locked.
struct SingleThreaded {
  using Count = ULONG;

  struct Section {
    HRESULT Create() { return S_OK; }
    void lock() {}
    void unlock() {}
  };
};

/// For classes registered "Both": any thread at any time.
struct FreeThreaded {
  using Count = std::atomic<ULONG>;
  using Section = CriticalSection;
};

}  // namespace Qel::Com
