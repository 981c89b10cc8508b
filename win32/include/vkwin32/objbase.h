// COM apartment initialisation for a thread, and the storage medium.
#pragma once

#include "objidl.h"
#include "types.h"
#include "winerror.h"

#define COINIT_MULTITHREADED 0x0
#define COINIT_APARTMENTTHREADED 0x2
#define COINIT_DISABLE_OLE1DDE 0x4
#define COINIT_SPEED_OVER_MEMORY 0x8

#define RPC_E_CHANGED_MODE VKW32_HR(0x80010106)

extern "C" {

HRESULT WINAPI CoInitialize(LPVOID reserved);
HRESULT WINAPI CoInitializeEx(LPVOID reserved, DWORD coInit);
void WINAPI CoUninitialize(void);

} // extern "C"
