#include "process_census.h"

#include <windows.h>

#include <array>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

void CountHeaps(ProcessCensus& census) {
  std::array<HANDLE, 64> heaps{};
  const DWORD count = GetProcessHeaps(static_cast<DWORD>(heaps.size()), heaps.data());
  for (DWORD i = 0; i < count && i < heaps.size(); ++i) {
    PROCESS_HEAP_ENTRY entry{};
    HeapLock(heaps[i]);
    while (HeapWalk(heaps[i], &entry) != FALSE) {
      if ((entry.wFlags & PROCESS_HEAP_ENTRY_BUSY) == 0) continue;
      ++census.heapBlocks;
      census.heapBytes += entry.cbData;
    }
    HeapUnlock(heaps[i]);
  }
}

/// Handles are small multiples of 4; GetProcessHandleCount answers 0 under some versions of Wine.
std::size_t CountHandles() {
  constexpr ULONG_PTR kEnd = 4 * 4096;
  std::size_t count = 0;
  for (ULONG_PTR handle = 4; handle < kEnd; handle += 4) {
    DWORD flags = 0;
    if (GetHandleInformation(reinterpret_cast<HANDLE>(handle), &flags) != FALSE) ++count;
  }
  return count;
}

/// How many slots are taken, found by taking all that are free and giving them back.
template <std::size_t kLimit, class Allocate, class Free>
std::size_t CountSlots(Allocate allocate, Free free) {
  static std::array<DWORD, kLimit> taken;
  std::size_t count = 0;
  while (count < kLimit) {
    const DWORD slot = allocate();
    if (slot == TLS_OUT_OF_INDEXES) break;
    taken[count++] = slot;
  }
  for (std::size_t i = 0; i < count; ++i) free(taken[i]);
  return kLimit - count;
}
static_assert(TLS_OUT_OF_INDEXES == FLS_OUT_OF_INDEXES);  // NOLINT(misc-redundant-expression): it is not

// The GDI handles as the process block refers to them, under Wine those of this process: GetGuiResources
// answers 0 under some versions of it.
struct GdiHandleEntry {
  void* object;
  WORD owner;  // process id; 0 for the system, or where that is not kept
  WORD count;
  WORD generation;
  WORD type;  // 0: not in use
  void* userData;
};
static_assert(sizeof(GdiHandleEntry) == 24);

std::size_t CountGdiObjects() {
  const HMODULE system = GetModuleHandleW(L"ntdll.dll");
  if (GetProcAddress(system, "wine_get_version") == nullptr) {
    return GetGuiResources(GetCurrentProcess(), GR_GDIOBJECTS);
  }
  constexpr std::size_t kHandleTable = 0xF8;  // offset in the process block
  constexpr std::size_t kEntries = 0x4000;    // as many as the smallest table of any system has
  using GetProcessBlock = const std::byte*();
  const auto getProcessBlock =
      reinterpret_cast<GetProcessBlock*>(reinterpret_cast<void*>(GetProcAddress(system, "RtlGetCurrentPeb")));
  const auto* const entries =
      *reinterpret_cast<const GdiHandleEntry* const*>(getProcessBlock() + kHandleTable);
  std::size_t count = 0;
  for (std::size_t i = 0; entries != nullptr && i < kEntries; ++i) {
    if (entries[i].type != 0) ++count;
  }
  return count;
}

}  // namespace

ProcessCensus ProcessCensus::Take() {
  ProcessCensus census;
  census.handles = CountHandles();
  census.gdiObjects = CountGdiObjects();
  // 64 slots and 1,024 more is what a process has; fiber-local ones are no more than 4,096 anywhere.
  census.threadSlots = CountSlots<1088>(&TlsAlloc, &TlsFree);
  census.fiberSlots = CountSlots<4096>([] { return FlsAlloc(nullptr); }, &FlsFree);
  CountHeaps(census);
  return census;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
