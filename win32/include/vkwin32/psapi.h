// Process-status services: the file names of a process's image and modules.
#pragma once

#include "types.h"
#include "winerror.h"

extern "C" {

// The real path of the process's program file (Windows gives a device path
// such as \Device\HarddiskVolume1\...; POSIX has none). Only a running
// process's program is known. A buffer without room for the path and its
// NUL fails with ERROR_INSUFFICIENT_BUFFER.
DWORD WINAPI GetProcessImageFileNameA(HANDLE process, LPSTR imageFileName, DWORD size);

// The path of a module: a null module or the program's own module handle is
// the program file; the modules GetModuleHandleA knows by name are the
// library file that implements them. Other processes' modules are unknown
// (ERROR_INVALID_HANDLE), save their program. A path longer than the buffer
// is cut to size - 1 characters and a NUL.
DWORD WINAPI GetModuleFileNameExA(HANDLE process, HMODULE module, LPSTR fileName, DWORD size);

} // extern "C"
