#include "scarce_system.h"

#include <objidl.h>
#include <oleauto.h>
#include <propidl.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <cstdlib>
#include <utility>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr std::int64_t kNever = -1;
std::int64_t g_untilFailure = kNever;
bool g_keepsFailing = false;
ScarceSystem::Lack g_failed = ScarceSystem::Lack::kNothing;

bool ShouldFail(ScarceSystem::Lack lack = ScarceSystem::Lack::kOther) {
  if (g_failed != ScarceSystem::Lack::kNothing && g_keepsFailing) return true;
  if (g_untilFailure == kNever) return false;
  --g_untilFailure;  // from 0 to kNever, so that only one call fails
  if (g_untilFailure != kNever) return false;
  g_failed = lack;
  return true;
}

/// Calls the function, or returns `kFailure` instead.
template <auto kFunction, auto kFailure, ScarceSystem::Lack kLack, class Result, class... Arguments>
Result Scarce(Arguments... arguments) {
  return ShouldFail(kLack) ? static_cast<Result>(kFailure) : kFunction(arguments...);
}

template <auto kFunction, auto kFailure, ScarceSystem::Lack kLack = ScarceSystem::Lack::kOther, class Result,
          class... Arguments>
ImportPatch Patch(HMODULE module, const char* name, Result (*)(Arguments...)) {
  return {module, name, &Scarce<kFunction, kFailure, kLack, Result, Arguments...>};
}

/// A task allocator whose allocations can fail.
class ScarceAllocator final : public IMalloc {
 public:
  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID, void**) override { return E_NOINTERFACE; }
  ULONG STDMETHODCALLTYPE AddRef() override { return 1; }
  ULONG STDMETHODCALLTYPE Release() override { return 1; }
  void* STDMETHODCALLTYPE Alloc(SIZE_T size) override {
    return ShouldFail() ? nullptr : CoTaskMemAlloc(size);
  }
  void* STDMETHODCALLTYPE Realloc(void* block, SIZE_T size) override {
    return ShouldFail() ? nullptr : CoTaskMemRealloc(block, size);
  }
  void STDMETHODCALLTYPE Free(void* block) override { CoTaskMemFree(block); }
  SIZE_T STDMETHODCALLTYPE GetSize(void*) override { return static_cast<SIZE_T>(-1); }
  int STDMETHODCALLTYPE DidAlloc(void*) override { return -1; }
  void STDMETHODCALLTYPE HeapMinimize() override {}
};

HRESULT WINAPI GiveScarceAllocator(IMalloc** allocator) {
  static ScarceAllocator scarce;
  *allocator = ShouldFail() ? nullptr : &scarce;
  return *allocator != nullptr ? S_OK : E_OUTOFMEMORY;
}

BOOL WINAPI MakeScarceSection(CRITICAL_SECTION* section, DWORD spinCount) {
  if (!ShouldFail()) return InitializeCriticalSectionAndSpinCount(section, spinCount);
  SetLastError(ERROR_OUTOFMEMORY);
  return FALSE;
}

HBITMAP WINAPI MakeScarceBitmap(HDC dc, const BITMAPINFO* info, UINT usage, void** bits, HANDLE section,
                                DWORD offset) {
  if (!ShouldFail()) return CreateDIBSection(dc, info, usage, bits, section, offset);
  *bits = nullptr;
  return nullptr;
}

}  // namespace

ScarceSystem::ScarceSystem(HMODULE module)
    : patches_{Patch<&std::malloc, nullptr, Lack::kMemory>(module, "malloc", &std::malloc),
               Patch<&std::calloc, nullptr, Lack::kMemory>(module, "calloc", &std::calloc),
               Patch<&std::realloc, nullptr, Lack::kMemory>(module, "realloc", &std::realloc),
               Patch<&SysAllocString, nullptr>(module, "SysAllocString", &SysAllocString),
               Patch<&SHStrDupW, E_OUTOFMEMORY>(module, "SHStrDupW", &SHStrDupW),
               Patch<&PropVariantCopy, E_OUTOFMEMORY>(module, "PropVariantCopy", &PropVariantCopy),
               ImportPatch(module, "SHGetMalloc", &GiveScarceAllocator),
               ImportPatch(module, "InitializeCriticalSectionAndSpinCount", &MakeScarceSection),
               ImportPatch(module, "CreateDIBSection", &MakeScarceBitmap)} {}

ScarceSystem::~ScarceSystem() {
  Recover();
}

void ScarceSystem::FailAt(std::int64_t request, Then then) {
  g_untilFailure = request;
  g_keepsFailing = then == Then::kKeepsFailing;
  g_failed = Lack::kNothing;
}

ScarceSystem::Lack ScarceSystem::Recover() {
  g_untilFailure = kNever;
  return std::exchange(g_failed, Lack::kNothing);
}

}  // namespace Qel::Lumetra::ShellExt::Testing
