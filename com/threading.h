// The two threading models of objects. Each defines the type of the reference count and of the lock in every
// object. CComRoot takes one of them as its first argument.
#pragma once

#include <windows.h>

#include <atomic>

#include "critical_section.h"

namespace Qel::Com {

/// For classes registered "Apartment": only one thread at a time uses an object, so nothing is locked.
struct SingleThreaded {
  using Count = ULONG;

  struct Section {
    HRESULT Create() { return S_OK; }
    void lock() {}
    void unlock() {}
  };
};

/// For classes registered "Both": any thread may use an object at any time.
struct FreeThreaded {
  using Count = std::atomic<ULONG>;
  using Section = CriticalSection;
};

}  // namespace Qel::Com
