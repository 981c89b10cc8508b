#include "hot_tls.h"

#include <vkwin32/kernel.h>

namespace {
VKW32_HOT_TLS thread_local DWORD lastError = ERROR_SUCCESS;
}

extern "C" DWORD WINAPI GetLastError(void) {
    return lastError;
}

extern "C" void WINAPI SetLastError(DWORD errorCode) {
    lastError = errorCode;
}
