// Stand-in for the header of Windows for pointers that are stored in another form than they are used in.
#pragma once

void* EncodePointer(void* pointer);
void* DecodePointer(void* pointer);
