// Stand-in for the header of the Windows C runtime's low-level file functions.
#pragma once

#include <cstdint>

constexpr int _O_RDONLY = 0;
constexpr int _O_BINARY = 0;

int _open_osfhandle(std::intptr_t handle, int flags);
int _close(int descriptor);
