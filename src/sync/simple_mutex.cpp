#include <vaskel/sync.h>

namespace vaskel {

bool CVKSimpleMutex::Lock(DWORD /*timeout*/) {
    while (InterlockedExchange(&m_nFlag, GetLockedFlag()) == GetLockedFlag())
        Sleep(0);
    return true;
}

bool CVKSimpleMutex::Unlock() {
    return InterlockedExchange(&m_nFlag, GetUnlockedFlag()) == GetLockedFlag();
}

} // namespace vaskel
