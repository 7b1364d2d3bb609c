#include "allocation_meter.h"

#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

std::atomic<std::int64_t> blocks{0};
std::atomic<std::int64_t> bytes{0};
std::atomic<std::int64_t> peak{0};
std::atomic<std::int64_t> largest{0};

constexpr std::int64_t kNever = -1;
thread_local std::int64_t untilFailure = kNever;
thread_local bool staysFull = false;
thread_local bool failed = false;

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

bool IsToFail() {
  if (failed && staysFull) return true;
  if (untilFailure == kNever || untilFailure-- > 0) return false;
  failed = true;
  return true;
}

void* Allocate(std::size_t size) {
  if (IsToFail()) return nullptr;
  void* const block = std::malloc(size);
  if (block == nullptr) return nullptr;
  const std::int64_t got = SizeOf(block);
  ++blocks;
  Raise(peak, bytes += got);
  Raise(largest, got);
  return block;
}

void Free(void* block) {
  if (block == nullptr) return;
  --blocks;
  bytes -= SizeOf(block);
  std::free(block);
}

}  // namespace

HeapUse CurrentHeapUse() {
  return {blocks, bytes};
}

HeapMeter::HeapMeter() : before_(bytes) {
  peak = before_;
  largest = 0;
}

std::int64_t HeapMeter::Peak() const {
  return peak - before_;
}

std::int64_t HeapMeter::Largest() const {
  return largest;
}

FailingHeap::FailingHeap(std::int64_t allocation, Then then) {
  untilFailure = allocation;
  staysFull = then == Then::kStaysFull;
  failed = false;
}

FailingHeap::~FailingHeap() {
  untilFailure = kNever;
  failed = false;
}

bool FailingHeap::Failed() const {
  return failed;
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
