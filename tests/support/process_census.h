// Counts the resources of a process that a DLL may fail to release.
#pragma once

#include <cstddef>

namespace Qel::Lumetra::ShellExt::Testing {

struct ProcessCensus {
  std::size_t heapBlocks = 0;  // in all heaps
  std::size_t heapBytes = 0;
  std::size_t threadSlots = 0;  // thread-local storage
  std::size_t fiberSlots = 0;   // fiber-local storage
  std::size_t handles = 0;      // kernel objects
  std::size_t gdiObjects = 0;

  /// Counts what the process holds now. No other thread may run meanwhile.
  static ProcessCensus Take();
};

}  // namespace Qel::Lumetra::ShellExt::Testing
