// Stand-in for the Windows header of thread synchronisation.
#pragma once

#include <windows.h>

constexpr DWORD ERROR_NOT_ENOUGH_MEMORY = 8;

struct CRITICAL_SECTION {
  void* mutex;
};

/// Returns FALSE if there is no memory.
BOOL InitializeCriticalSectionAndSpinCount(CRITICAL_SECTION* section, DWORD spinCount);
void EnterCriticalSection(CRITICAL_SECTION* section);
void LeaveCriticalSection(CRITICAL_SECTION* section);
void DeleteCriticalSection(CRITICAL_SECTION* section);

/// Always returns ERROR_NOT_ENOUGH_MEMORY, the only error of the only function whose error is queried,
/// InitializeCriticalSectionAndSpinCount.
DWORD GetLastError();
