// Implements critical sections and encoded pointers.
#include <synchapi.h>
#include <utilapiset.h>

#include <cstdint>
#include <mutex>
#include <new>

namespace {

std::recursive_mutex& Mutex(CRITICAL_SECTION* section) {
  return *static_cast<std::recursive_mutex*>(section->mutex);
}

/// Encodes or decodes a pointer; the function is its own inverse.
void* Recode(void* pointer) {
  return reinterpret_cast<void*>(~reinterpret_cast<std::uintptr_t>(pointer));
}

}  // namespace

BOOL InitializeCriticalSectionAndSpinCount(CRITICAL_SECTION* section, DWORD) {
  section->mutex = new (std::nothrow) std::recursive_mutex;
  return section->mutex != nullptr ? TRUE : FALSE;
}

void EnterCriticalSection(CRITICAL_SECTION* section) {
  Mutex(section).lock();
}

void LeaveCriticalSection(CRITICAL_SECTION* section) {
  Mutex(section).unlock();
}

void DeleteCriticalSection(CRITICAL_SECTION* section) {
  delete &Mutex(section);
}

DWORD GetLastError() {
  return ERROR_NOT_ENOUGH_MEMORY;
}

void* EncodePointer(void* pointer) {
  return Recode(pointer);
}

void* DecodePointer(void* pointer) {
  return Recode(pointer);
}
