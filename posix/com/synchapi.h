// Stand-in for the header of Windows for locks between threads.
#pragma once

#include <windows.h>

constexpr DWORD ERROR_NOT_ENOUGH_MEMORY = 8;

struct CRITICAL_SECTION {
  void* mutex;
};

/// Fails only without memory.
BOOL InitializeCriticalSectionAndSpinCount(CRITICAL_SECTION* section, DWORD spinCount);
void EnterCriticalSection(CRITICAL_SECTION* section);
void LeaveCriticalSection(CRITICAL_SECTION* section);
void DeleteCriticalSection(CRITICAL_SECTION* section);

/// Returns the error of a critical section that could not be made. Nothing else is asked for its error.
DWORD GetLastError();
