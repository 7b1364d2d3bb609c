#include "allocation_meter.h"

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

std::atomic<std::int64_t> g_blocks{0};
std::atomic<std::int64_t> g_bytes{0};
std::atomic<std::int64_t> g_peak{0};
std::atomic<std::int64_t> g_largest{0};

constexpr std::int64_t kNever = -1;
thread_local std::int64_t g_untilFailure = kNever;
thread_local bool g_keepsFailing = false;
thread_local bool g_failed = false;

std::int64_t SizeOf(void* block) {
#ifdef _WIN32
  return static_cast<std::int64_t>(_msize(block));
#else
  return static_cast<std::int64_t>(malloc_usable_size(block));
#endif
}

void Raise(std::atomic<std::int64_t>& most, std::int64_t value) {
  std::int64_t old = most;
  while (old < value && !most.compare_exchange_weak(old, value)) {
  }
}

bool ShouldFail() {
  if (g_failed && g_keepsFailing) return true;
  if (g_untilFailure == kNever) return false;
  --g_untilFailure;  // from 0 to kNever, so that only one allocation fails
  if (g_untilFailure != kNever) return false;
  g_failed = true;
  return true;
}

void* Allocate(std::size_t size) {
  if (ShouldFail()) return nullptr;
  void* const block = std::malloc(size);
  if (block == nullptr) return nullptr;
  const std::int64_t got = SizeOf(block);
  ++g_blocks;
  Raise(g_peak, g_bytes += got);
  Raise(g_largest, got);
  return block;
}

void Free(void* block) {
  if (block == nullptr) return;
  --g_blocks;
  g_bytes -= SizeOf(block);
  std::free(block);
}

}  // namespace

HeapUse CurrentHeapUse() {
  return {g_blocks, g_bytes};
}

HeapMeter::HeapMeter() : before_(g_bytes) {
  g_peak = before_;
  g_largest = 0;
}

std::int64_t HeapMeter::Peak() const {
  return g_peak - before_;
}

std::int64_t HeapMeter::Largest() const {
  return g_largest;
}

FailingHeap::FailingHeap(std::int64_t allocation, Then then) {
  g_untilFailure = allocation;
  g_keepsFailing = then == Then::kKeepsFailing;
  g_failed = false;
}

FailingHeap::~FailingHeap() {
  g_untilFailure = kNever;
  g_failed = false;
}

bool FailingHeap::Failed() const {
  return g_failed;
}

}  // namespace Qel::Lumetra::ShellExt::Testing

using Qel::Lumetra::ShellExt::Testing::Allocate;
using Qel::Lumetra::ShellExt::Testing::Free;

void* operator new(std::size_t size) {
  if (void* const block = Allocate(size)) return block;
  throw std::bad_alloc();
}
void* operator new[](std::size_t size) {
  return operator new(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return Allocate(size);
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
  return Allocate(size);
}
void operator delete(void* block) noexcept {
  Free(block);
}
void operator delete[](void* block) noexcept {
  Free(block);
}
void operator delete(void* block, std::size_t) noexcept {
  Free(block);
}
void operator delete[](void* block, std::size_t) noexcept {
  Free(block);
}
