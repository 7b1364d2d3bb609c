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

/// Counts by trying every value that a handle can have, as they are small multiples of 4.
/// GetProcessHandleCount returns 0 under some versions of Wine.
std::size_t CountHandles() {
  constexpr ULONG_PTR kEnd = 4 * 4096;
  std::size_t count = 0;
  for (ULONG_PTR handle = 4; handle < kEnd; handle += 4) {
    DWORD flags = 0;
    if (GetHandleInformation(reinterpret_cast<HANDLE>(handle), &flags) != FALSE) ++count;
  }
  return count;
}

/// Returns how many slots are in use, by allocating all free ones and freeing them again.
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

// An entry of the table of GDI handles that the process block points to. Under Wine the table lists the
// handles of this process only. Needed because GetGuiResources returns 0 under some versions of Wine.
struct GdiHandleEntry {
  void* object;
  WORD owner;  // process id; 0 for the system, or if Wine does not record it
  WORD count;
  WORD generation;
  WORD type;  // 0 if unused
  void* userData;
};
static_assert(sizeof(GdiHandleEntry) == 24);

std::size_t CountGdiObjects() {
  const HMODULE system = GetModuleHandleW(L"ntdll.dll");
  if (GetProcAddress(system, "wine_get_version") == nullptr) {
    return GetGuiResources(GetCurrentProcess(), GR_GDIOBJECTS);
  }
  constexpr std::size_t kHandleTable = 0xF8;  // offset in the process block
  constexpr std::size_t kEntries = 0x4000;    // the size of the smallest table of any system
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
  // A process has 64 + 1,024 thread-local slots. No system has more than 4,096 fiber-local ones.
  census.threadSlots = CountSlots<1088>(&TlsAlloc, &TlsFree);
  census.fiberSlots = CountSlots<4096>([] { return FlsAlloc(nullptr); }, &FlsFree);
  CountHeaps(census);
  return census;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
