// The compiler's COM error exception and the support types of comutil.h.
// This platform has no rich error objects: an error carries its HRESULT only.
#pragma once

#include "comutil.h"
#include "types.h"
#include "winerror.h"

class _com_error {
public:
    explicit _com_error(HRESULT hr) noexcept : m_hresult(hr), m_message(nullptr) {}
    _com_error(const _com_error& other) noexcept : m_hresult(other.m_hresult), m_message(nullptr) {}
    virtual ~_com_error() { delete[] m_message; }
    _com_error& operator=(const _com_error& other) noexcept;

    HRESULT Error() const noexcept { return m_hresult; }
    // The dispatch exception code of an HRESULT in its range, else 0.
    WORD WCode() const noexcept { return HRESULTToWCode(m_hresult); }
    _bstr_t Description() const { return _bstr_t(); }
    _bstr_t Source() const { return _bstr_t(); }
    // The system's text for the code without its line break, or
    // "IDispatch error #n" / "Unknown error 0x...".
    const char* ErrorMessage() const noexcept;

    static HRESULT WCodeToHRESULT(WORD code) noexcept {
        return code >= 0xFE00 ? WCODE_HRESULT_LAST : WCODE_HRESULT_FIRST + code;
    }
    static WORD HRESULTToWCode(HRESULT hr) noexcept {
        return hr >= WCODE_HRESULT_FIRST && hr <= WCODE_HRESULT_LAST
                   ? static_cast<WORD>(hr - WCODE_HRESULT_FIRST)
                   : 0;
    }

private:
    static constexpr HRESULT WCODE_HRESULT_FIRST = MAKE_HRESULT(SEVERITY_ERROR, FACILITY_ITF, 0x200);
    static constexpr HRESULT WCODE_HRESULT_LAST =
        MAKE_HRESULT(SEVERITY_ERROR, FACILITY_ITF + 1, 0) - 1;

    HRESULT m_hresult;
    mutable char* m_message;
};
