#include <vaskel/sync.h>

namespace vaskel {

namespace {

// The owner's thread identifier, 0 when free. The owner field is written by
// whichever thread enters or leaves, so it is read atomically.
DWORD OwnerOf(CRITICAL_SECTION& section) {
    return static_cast<DWORD>(reinterpret_cast<ULONG_PTR>(
        InterlockedCompareExchangePointer(&section.OwningThread, nullptr, nullptr)));
}

} // namespace

CVKCriticalSection::CVKCriticalSection() {
    InitializeCriticalSection(&m_cs);
}

CVKCriticalSection::~CVKCriticalSection() {
    DeleteCriticalSection(&m_cs);
}

bool CVKCriticalSection::Lock(DWORD /*timeout*/) const {
    EnterCriticalSection(&m_cs);
    return true;
}

bool CVKCriticalSection::Unlock() const {
    LeaveCriticalSection(&m_cs);
    return true;
}

bool CVKCriticalSection::IsLocked() const {
    return OwnerOf(m_cs) != 0;
}

bool CVKCriticalSection::IsLockedByCurrentThread() const {
    return OwnerOf(m_cs) == GetCurrentThreadId();
}

} // namespace vaskel
