#include "hot_tls.h"

#include <vkwin32/kernel.h>

#include <sys/syscall.h>
#include <unistd.h>

extern "C" DWORD WINAPI GetCurrentThreadId(void) {
    // The kernel's thread identifier: unique among live threads, non-zero and
    // within 32 bits (pid_max is at most 2^22).
    VKW32_HOT_TLS thread_local const DWORD id = static_cast<DWORD>(::syscall(SYS_gettid));
    return id;
}

extern "C" DWORD WINAPI GetCurrentProcessId(void) {
    return static_cast<DWORD>(::getpid());
}
