// What a test program takes from the heap, and a heap that gives no more. A program that is linked with this
// has its operator new and delete replaced; memory from elsewhere, such as the system's bitmaps, is not seen.
#pragma once

#include <cstdint>

namespace Qel::Lumetra::ShellExt::Testing {

struct HeapUse {
  std::int64_t blocks = 0;
  std::int64_t bytes = 0;

  friend bool operator==(const HeapUse&, const HeapUse&) = default;
};

/// What is allocated now by all threads.
HeapUse CurrentHeapUse();

/// Measures from its construction on.
class HeapMeter {
 public:
  HeapMeter();

  /// The most bytes in use at a time beyond those that were in use at the beginning.
  std::int64_t Peak() const;

  /// The largest single allocation.
  std::int64_t Largest() const;

 private:
  std::int64_t before_;
};

/// As long as it lives, one allocation of this thread fails, and if asked so all after it.
class FailingHeap {
 public:
  enum class Then { kRecovers, kStaysFull };

  /// `allocation` is the one that fails, counted from 0.
  FailingHeap(std::int64_t allocation, Then then);
  ~FailingHeap();
  FailingHeap(const FailingHeap&) = delete;
  FailingHeap& operator=(const FailingHeap&) = delete;

  /// Whether it has come to the failure.
  bool Failed() const;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
