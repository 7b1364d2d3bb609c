// Measures what a test program allocates on the heap, and makes allocations fail. A program that links this
// gets its own operator new and delete. Memory from elsewhere, such as the system's bitmaps, does not count.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt::Testing {

struct HeapUse {
  std::int64_t blocks = 0;
  std::int64_t bytes = 0;

  friend bool operator==(const HeapUse&, const HeapUse&) = default;
};

/// Returns what all threads have allocated and not freed.
HeapUse CurrentHeapUse();

/// Measures from its construction on. Only one may exist at a time, because the next one resets the maxima.
class HeapMeter {
 public:
  HeapMeter();

  /// Returns the maximum of the bytes in use since construction, less those in use at construction.
  std::int64_t Peak() const;

  /// Returns the bytes of the largest single allocation.
  std::int64_t Largest() const;

 private:
  std::int64_t before_;
};

/// While this object exists, one allocation of this thread fails, and with kKeepsFailing all later ones too.
class FailingHeap {
 public:
  enum class Then { kRecovers, kKeepsFailing };

  /// `allocation` is the index, from 0, of the allocation that fails.
  FailingHeap(std::int64_t allocation, Then then);
  ~FailingHeap();
  FailingHeap(const FailingHeap&) = delete;
  FailingHeap& operator=(const FailingHeap&) = delete;

  /// Returns whether an allocation has failed.
  bool Failed() const;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
