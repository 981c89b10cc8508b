// The multimedia services: the millisecond system time.
#pragma once

#include "types.h"

extern "C" {

DWORD WINAPI timeGetTime(void);

} // extern "C"
