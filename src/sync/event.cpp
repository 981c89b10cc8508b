#include <vaskel/diag.h>
#include <vaskel/sync.h>

namespace vaskel {

CVKEvent::CVKEvent(bool initialState, bool manualReset, const char* name,
                   SECURITY_ATTRIBUTES* attributes)
    : m_hEvent(CreateEventA(attributes, manualReset, initialState, name)) {
    if (m_hEvent == nullptr)
        throw resource_error();
}

// The constructor never leaves the handle null.
CVKEvent::~CVKEvent() {
    CloseHandle(m_hEvent);
}

bool CVKEvent::Lock(DWORD timeout) {
    return WaitForSingleObject(m_hEvent, timeout) == WAIT_OBJECT_0;
}

bool CVKEvent::SetEvent(void* handle) {
    return ::SetEvent(handle) != FALSE;
}

bool CVKEvent::PulseEvent(void* handle) {
    return ::PulseEvent(handle) != FALSE;
}

bool CVKEvent::ResetEvent(void* handle) {
    return ::ResetEvent(handle) != FALSE;
}

} // namespace vaskel
