#include <vaskel/marshal.h>

#include <cstring>

namespace vaskel {

CVKGlobalHandle::CVKGlobalHandle(DWORD size, UINT flags) : m_handle(GlobalAlloc(flags, size)) {}

CVKGlobalHandle::CVKGlobalHandle(void* handle, bool copy) : m_handle(nullptr) {
    if (copy)
        Copy(handle);
    else
        m_handle = handle;
}

void CVKGlobalHandle::Release() {
    if (m_handle)
        GlobalFree(m_handle);
    m_handle = nullptr;
}

void CVKGlobalHandle::Attach(void* handle) {
    if (handle == m_handle)
        return;
    Release();
    m_handle = handle;
}

void* CVKGlobalHandle::Detach() {
    void* handle = m_handle;
    m_handle = nullptr;
    return handle;
}

void CVKGlobalHandle::Copy(void* handle) {
    if (handle == m_handle)
        return;
    Release();
    if (handle == nullptr)
        return;
    const SIZE_T size = GlobalSize(handle);
    HGLOBAL copy = GlobalAlloc(0, size);
    if (copy == nullptr)
        return;
    if (size > 0) {
        // A fixed block is its own address; the source may be movable.
        const void* source = GlobalLock(handle);
        if (source == nullptr) {
            GlobalFree(copy);
            return;
        }
        std::memcpy(copy, source, size);
        GlobalUnlock(handle);
    }
    m_handle = copy;
}

} // namespace vaskel
