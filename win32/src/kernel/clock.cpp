// The performance counter, tick counts and sleeping, on the monotonic clock.
#include "clock.h"

#include <vkwin32/kernel.h>
#include <vkwin32/synch.h>

#include <atomic>
#include <cerrno>
#include <ctime>
#include <sched.h>
#include <unistd.h>

namespace vkw32 {
namespace {

// 100-nanosecond ticks, the frequency modern Windows reports: it keeps
// conversions of long intervals to nanoseconds within 64 bits.
const LONGLONG counterFrequency = 10000000;

std::atomic<DWORD> tickOffset{0};

struct timespec Now() {
    struct timespec now;
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    return now;
}

ULONGLONG Milliseconds(clockid_t clock) {
    struct timespec now;
    ::clock_gettime(clock, &now);
    return static_cast<ULONGLONG>(now.tv_sec) * 1000 +
           static_cast<ULONGLONG>(now.tv_nsec) / 1000000 +
           tickOffset.load(std::memory_order_relaxed);
}

} // namespace

ULONGLONG MillisecondClock() {
    return Milliseconds(CLOCK_MONOTONIC_COARSE);
}

ULONGLONG PreciseMillisecondClock() {
    return Milliseconds(CLOCK_MONOTONIC);
}

} // namespace vkw32

extern "C" BOOL WINAPI QueryPerformanceFrequency(LARGE_INTEGER* frequency) {
    if (frequency == nullptr) {
        SetLastError(ERROR_NOACCESS);
        return FALSE;
    }
    frequency->QuadPart = vkw32::counterFrequency;
    return TRUE;
}

extern "C" BOOL WINAPI QueryPerformanceCounter(LARGE_INTEGER* count) {
    if (count == nullptr) {
        SetLastError(ERROR_NOACCESS);
        return FALSE;
    }
    struct timespec now = vkw32::Now();
    count->QuadPart =
        static_cast<LONGLONG>(now.tv_sec) * vkw32::counterFrequency + now.tv_nsec / 100;
    return TRUE;
}

extern "C" DWORD WINAPI GetTickCount(void) {
    return static_cast<DWORD>(vkw32::MillisecondClock());
}

extern "C" ULONGLONG WINAPI GetTickCount64(void) {
    return vkw32::MillisecondClock();
}

extern "C" void WINAPI VkW32SetTickOffset(DWORD offsetMilliseconds) {
    vkw32::tickOffset.store(offsetMilliseconds, std::memory_order_relaxed);
}

extern "C" void WINAPI Sleep(DWORD milliseconds) {
    if (milliseconds == 0) {
        ::sched_yield();
        return;
    }
    if (milliseconds == INFINITE) {
        for (;;)
            ::pause();
    }
    struct timespec remaining;
    remaining.tv_sec = milliseconds / 1000;
    remaining.tv_nsec = static_cast<long>(milliseconds % 1000) * 1000000;
    while (::nanosleep(&remaining, &remaining) != 0 && errno == EINTR) {
    }
}
