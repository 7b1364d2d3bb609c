// Stand-in for the Windows header of encoded pointers.
#pragma once

void* EncodePointer(void* pointer);
void* DecodePointer(void* pointer);
