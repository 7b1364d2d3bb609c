// What a process holds of the things that a DLL may forget to give back.
#pragma once

#include <cstddef>

namespace Qel::Lumetra::ShellExt::Testing {

struct ProcessCensus {
  std::size_t heapBlocks = 0;  // of all heaps
  std::size_t heapBytes = 0;
  std::size_t threadSlots = 0;  // thread-local
  std::size_t fiberSlots = 0;   // fiber-local
  std::size_t handles = 0;      // of the kernel
  std::size_t gdiObjects = 0;

  /// Counts while no other thread runs.
  static ProcessCensus Take();
};

}  // namespace Qel::Lumetra::ShellExt::Testing
