// Critical sections on a futex. LockCount is the lock word: 0 free, 1 taken,
// 2 taken with threads waiting; OwningThread holds the owner's identifier
// and RecursionCount its depth. The owner and the lock word are read by
// other threads, so both are accessed atomically.
#include <vkwin32/kernel.h>
#include <vkwin32/synch.h>

#include <climits>
#include <linux/futex.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

const LONG freeState = 0;
const LONG takenState = 1;
const LONG contendedState = 2;

void FutexWait(LONG* word, LONG expected) {
    ::syscall(SYS_futex, word, FUTEX_WAIT_PRIVATE, expected, nullptr, nullptr, 0);
}

void FutexWakeOne(LONG* word) {
    ::syscall(SYS_futex, word, FUTEX_WAKE_PRIVATE, 1, nullptr, nullptr, 0);
}

DWORD OwnerOf(LPCRITICAL_SECTION section) {
    return static_cast<DWORD>(
        reinterpret_cast<ULONG_PTR>(__atomic_load_n(&section->OwningThread, __ATOMIC_RELAXED)));
}

void BecomeOwner(LPCRITICAL_SECTION section, DWORD thread) {
    __atomic_store_n(&section->OwningThread,
                     reinterpret_cast<HANDLE>(static_cast<ULONG_PTR>(thread)), __ATOMIC_RELAXED);
    section->RecursionCount = 1;
}

bool TryTake(LPCRITICAL_SECTION section) {
    LONG expected = freeState;
    return __atomic_compare_exchange_n(&section->LockCount, &expected, takenState, false,
                                       __ATOMIC_ACQUIRE, __ATOMIC_RELAXED);
}

// Sections guard short regions: a contender that waits briefly usually gets
// the lock without sleeping.
bool SpinToTake(LPCRITICAL_SECTION section) {
    for (int i = 0; i < 200; ++i) {
        if (__atomic_load_n(&section->LockCount, __ATOMIC_RELAXED) == freeState && TryTake(section))
            return true;
#if defined(__x86_64__) || defined(__i386__)
        __builtin_ia32_pause();
#endif
    }
    return false;
}

} // namespace

extern "C" void WINAPI InitializeCriticalSection(LPCRITICAL_SECTION section) {
    section->DebugInfo = nullptr;
    section->LockCount = freeState;
    section->RecursionCount = 0;
    section->OwningThread = nullptr;
    section->LockSemaphore = nullptr;
    section->SpinCount = 0;
}

extern "C" void WINAPI EnterCriticalSection(LPCRITICAL_SECTION section) {
    DWORD thread = GetCurrentThreadId();
    if (OwnerOf(section) == thread) {
        ++section->RecursionCount;
        return;
    }
    if (!TryTake(section) && !SpinToTake(section)) {
        // Mark the lock contended, so that its owner wakes a waiter on leaving.
        while (__atomic_exchange_n(&section->LockCount, contendedState, __ATOMIC_ACQUIRE) !=
               freeState)
            FutexWait(&section->LockCount, contendedState);
    }
    BecomeOwner(section, thread);
}

extern "C" BOOL WINAPI TryEnterCriticalSection(LPCRITICAL_SECTION section) {
    DWORD thread = GetCurrentThreadId();
    if (OwnerOf(section) == thread) {
        ++section->RecursionCount;
        return TRUE;
    }
    if (!TryTake(section))
        return FALSE;
    BecomeOwner(section, thread);
    return TRUE;
}

extern "C" void WINAPI LeaveCriticalSection(LPCRITICAL_SECTION section) {
    // Leaving a section the caller does not own is an error the platform
    // does not report; it is ignored rather than freeing another's lock.
    if (OwnerOf(section) != GetCurrentThreadId())
        return;
    if (--section->RecursionCount > 0)
        return;
    __atomic_store_n(&section->OwningThread, nullptr, __ATOMIC_RELAXED);
    if (__atomic_exchange_n(&section->LockCount, freeState, __ATOMIC_RELEASE) == contendedState)
        FutexWakeOne(&section->LockCount);
}

extern "C" void WINAPI DeleteCriticalSection(LPCRITICAL_SECTION section) {
    section->OwningThread = nullptr;
    section->RecursionCount = 0;
}
