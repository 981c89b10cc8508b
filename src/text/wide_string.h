// 8-bit text as a BSTR, with the failure as an HRESULT rather than an
// exception, for callers that report failures rather than throw them.
#pragma once

#include <vaskel/win32.h>

#include <cstring>

namespace vaskel {

class WideString {
public:
    // A null text is a null string. Text longer than a BSTR can hold, or
    // that the code page cannot convert, leaves a failure in Status().
    WideString(const char* text, UINT codePage) {
        if (!text)
            return;
        const std::size_t bytes = std::strlen(text);
        if (bytes > 0x3FFFFFFE) {
            m_status = E_OUTOFMEMORY;
            return;
        }
        // No code page gives more UTF-16 units than bytes: one allocation
        // suffices, cut to size only when the text converts shorter.
        m_string = SysAllocStringLen(nullptr, static_cast<UINT>(bytes));
        if (!m_string) {
            m_status = E_OUTOFMEMORY;
            return;
        }
        if (bytes == 0)
            return;
        const int units = MultiByteToWideChar(codePage, 0, text, static_cast<int>(bytes), m_string,
                                              static_cast<int>(bytes));
        if (units <= 0) {
            m_status = HRESULT_FROM_WIN32(GetLastError());
            if (SUCCEEDED(m_status))
                m_status = E_INVALIDARG;
        } else if (static_cast<std::size_t>(units) < bytes &&
                   !SysReAllocStringLen(&m_string, m_string, static_cast<UINT>(units))) {
            m_status = E_OUTOFMEMORY;
        }
        if (FAILED(m_status)) {
            SysFreeString(m_string);
            m_string = nullptr;
        }
    }
    WideString(const WideString&) = delete;
    WideString& operator=(const WideString&) = delete;
    ~WideString() { SysFreeString(m_string); }

    HRESULT Status() const { return m_status; }
    BSTR get() const { return m_string; }
    // Gives the string to the caller.
    BSTR Detach() {
        BSTR string = m_string;
        m_string = nullptr;
        return string;
    }

private:
    BSTR m_string = nullptr;
    HRESULT m_status = S_OK;
};

} // namespace vaskel
