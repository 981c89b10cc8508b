// CWnd: the framework's window object. The library needs only a placeholder
// that a thread can hold as its main window; it owns no window.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

namespace vaskel {

class VASKEL_API CWnd {
public:
    CWnd() = default;
    CWnd(const CWnd&) = delete;
    CWnd& operator=(const CWnd&) = delete;
    virtual ~CWnd();

    HWND GetSafeHwnd() const { return m_hWnd; }

    HWND m_hWnd = nullptr;
};

} // namespace vaskel
