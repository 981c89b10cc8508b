#include <vaskel/framework/exceptions.h>
#include <vaskel/sync.h>

namespace vaskel {

namespace {

// An interlocked read: slots change under other threads' compare-exchanges.
HWND LoadSlot(HWND* slot) {
    return static_cast<HWND>(InterlockedCompareExchangePointer(
        reinterpret_cast<PVOID volatile*>(slot), nullptr, nullptr));
}

HWND FirstClientOtherThan(HWND* first, DWORD count, HWND excluded) {
    for (DWORD i = 0; i < count; ++i) {
        HWND window = LoadSlot(&first[i]);
        if (window != nullptr && window != excluded)
            return window;
    }
    return nullptr;
}

} // namespace

bool EventsViaHandles::StoreValue(HWND* slot, HWND newValue, HWND expected) {
    return InterlockedCompareExchangePointer(reinterpret_cast<PVOID volatile*>(slot), newValue,
                                             expected) == expected;
}

// A slot that another thread takes first is skipped.
bool EventsViaHandles::ClaimFreeSlot(HWND window) {
    for (DWORD i = 0; i < m_nCount; ++i) {
        if (LoadSlot(&m_pFirst[i]) == nullptr && StoreValue(&m_pFirst[i], window, nullptr))
            return true;
    }
    return false;
}

bool EventsViaHandles::RegisterHandle(HWND window) {
    if (window == nullptr)
        return false;
    if (HandleIsRegistered(window))
        return true;
    // A second scan finds slots that other threads freed meanwhile.
    if (ClaimFreeSlot(window) || ClaimFreeSlot(window))
        return true;
    if (FreeInvalideHandles() && ClaimFreeSlot(window))
        return true;
    AfxThrowInvalidArgException();
}

bool EventsViaHandles::UnregisterHandle(HWND window) {
    for (DWORD i = 0; i < m_nCount; ++i) {
        if (LoadSlot(&m_pFirst[i]) == window && StoreValue(&m_pFirst[i], nullptr, window))
            return true;
    }
    return false;
}

bool EventsViaHandles::HandleIsRegistered(HWND window) const {
    for (DWORD i = 0; i < m_nCount; ++i) {
        if (LoadSlot(&m_pFirst[i]) == window)
            return true;
    }
    return false;
}

// A free slot counts too: it is as good as a freed one to a caller that
// wants to register.
bool EventsViaHandles::FreeInvalideHandles() {
    bool freed = false;
    for (DWORD i = 0; i < m_nCount; ++i) {
        HWND window = LoadSlot(&m_pFirst[i]);
        if (!IsWindow(window) && StoreValue(&m_pFirst[i], nullptr, window))
            freed = true;
    }
    return freed;
}

void EventsViaHandles::SendMessageToClients(UINT message, WPARAM wParam, LPARAM lParam) {
    for (DWORD i = 0; i < m_nCount; ++i) {
        if (HWND window = LoadSlot(&m_pFirst[i]))
            SendMessageA(window, message, wParam, lParam);
    }
}

void EventsViaHandles::PosMessageToClients(UINT message, WPARAM wParam, LPARAM lParam) {
    PosMessageToClientsExcluding(nullptr, message, wParam, lParam);
}

void EventsViaHandles::PosMessageToClientsExcluding(HWND excluded, UINT message, WPARAM wParam,
                                                    LPARAM lParam) {
    for (DWORD i = 0; i < m_nCount; ++i) {
        HWND window = LoadSlot(&m_pFirst[i]);
        if (window != nullptr && window != excluded)
            PostMessageA(window, message, wParam, lParam);
    }
}

void EventsViaHandles::PosMessageToAnyExcluding(HWND excluded, UINT message, WPARAM wParam,
                                                LPARAM lParam) {
    if (HWND window = FirstClientOtherThan(m_pFirst, m_nCount, excluded))
        PostMessageA(window, message, wParam, lParam);
}

void EventsViaHandles::SendMessageToAnyExcluding(HWND excluded, UINT message, WPARAM wParam,
                                                 LPARAM lParam) {
    if (HWND window = FirstClientOtherThan(m_pFirst, m_nCount, excluded))
        SendMessageA(window, message, wParam, lParam);
}

} // namespace vaskel
