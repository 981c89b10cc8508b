// The compiler's COM support types: _bstr_t, a shared reference-counted BSTR
// that also shows itself as ANSI text, and _variant_t, a VARIANT that owns
// its content. Failures are thrown as _com_error (comdef.h) through
// _com_issue_error.
//
// The integer constructors follow the native types: int gives VT_INT and
// long VT_I4, so on this platform a LONG (32-bit int) gives VT_INT and a
// DWORD VT_UINT where Windows gives VT_I4 and VT_UI4; a long or unsigned
// long beyond 32 bits throws DISP_E_OVERFLOW instead of being cut.
#pragma once

#include "oleauto.h"
#include "types.h"

class _com_error;
class _variant_t;

// Throws _com_error with the code.
[[noreturn]] void WINAPI _com_issue_error(HRESULT hr);

namespace _com_util {

inline void CheckError(HRESULT hr) {
    if (hr < 0)
        _com_issue_error(hr);
}

// ANSI (UTF-8) text to a new BSTR and back to a new[] array; null gives null.
BSTR WINAPI ConvertStringToBSTR(const char* text);
char* WINAPI ConvertBSTRToString(BSTR text);

} // namespace _com_util

class _bstr_t {
public:
    _bstr_t() noexcept : m_Data(nullptr) {}
    _bstr_t(const _bstr_t& other) noexcept;
    _bstr_t(const char* text);
    _bstr_t(const OLECHAR* text);
    _bstr_t(const _variant_t& value);
    // Without copy the _bstr_t takes the string over.
    _bstr_t(BSTR text, bool copy);
    ~_bstr_t() noexcept { Release(); }

    _bstr_t& operator=(const _bstr_t& other) noexcept;
    _bstr_t& operator=(const char* text);
    _bstr_t& operator=(const OLECHAR* text);
    _bstr_t& operator=(const _variant_t& value);
    _bstr_t& operator+=(const _bstr_t& other);
    _bstr_t operator+(const _bstr_t& other) const;
    friend _bstr_t operator+(const char* left, const _bstr_t& right);
    friend _bstr_t operator+(const OLECHAR* left, const _bstr_t& right);

    operator const OLECHAR*() const noexcept { return m_Data ? m_Data->wide : nullptr; }
    operator OLECHAR*() const noexcept { return m_Data ? m_Data->wide : nullptr; }
    // The ANSI form is made on first use and kept with the shared string.
    operator const char*() const;
    operator char*() const;

    bool operator!() const noexcept { return !m_Data || !m_Data->wide; }
    // Code unit by code unit over the whole length; a null string equals an
    // empty one.
    bool operator==(const _bstr_t& other) const noexcept { return Compare(other) == 0; }
    bool operator!=(const _bstr_t& other) const noexcept { return Compare(other) != 0; }
    bool operator<(const _bstr_t& other) const noexcept { return Compare(other) < 0; }
    bool operator>(const _bstr_t& other) const noexcept { return Compare(other) > 0; }
    bool operator<=(const _bstr_t& other) const noexcept { return Compare(other) <= 0; }
    bool operator>=(const _bstr_t& other) const noexcept { return Compare(other) >= 0; }

    // A new string the caller frees, or the shared one itself.
    BSTR copy(bool copy = true) const;
    unsigned int length() const noexcept { return m_Data ? SysStringLen(m_Data->wide) : 0; }
    // Replaces the content with a copy of the string.
    void Assign(BSTR text);
    // The string itself; the reference lets a callee replace it.
    BSTR& GetBSTR();
    // Frees the content and gives the slot for a callee to fill.
    BSTR* GetAddress();
    void Attach(BSTR text);
    BSTR Detach() noexcept;

private:
    struct Data {
        BSTR wide;
        mutable char* ansi;
        ULONG refs;
    };

    static Data* NewData(BSTR owned);
    void Release() noexcept;
    // Makes sure this object alone holds m_Data, creating an empty one.
    Data& Own();
    int Compare(const _bstr_t& other) const noexcept;

    Data* m_Data;
};

class _variant_t : public tagVARIANT {
public:
    _variant_t() noexcept { VariantInit(this); }
    _variant_t(const VARIANT& source);
    _variant_t(const VARIANT* source);
    _variant_t(const _variant_t& source);
    // Without copy the _variant_t takes the variant over and empties it.
    _variant_t(VARIANT& source, bool copy);
    _variant_t(short value, VARTYPE type = VT_I2);
    _variant_t(long value, VARTYPE type = VT_I4);
    _variant_t(float value) noexcept;
    _variant_t(double value, VARTYPE type = VT_R8);
    _variant_t(const CY& value) noexcept;
    _variant_t(const _bstr_t& value);
    _variant_t(const OLECHAR* value);
    _variant_t(const char* value);
    _variant_t(IDispatch* value, bool addRef = true) noexcept;
    _variant_t(bool value) noexcept;
    _variant_t(IUnknown* value, bool addRef = true) noexcept;
    _variant_t(const DECIMAL& value) noexcept;
    _variant_t(BYTE value) noexcept;
    _variant_t(char value) noexcept;
    _variant_t(unsigned short value) noexcept;
    _variant_t(unsigned long value);
    _variant_t(int value) noexcept;
    _variant_t(unsigned int value) noexcept;
    _variant_t(long long value) noexcept;
    _variant_t(unsigned long long value) noexcept;
    ~_variant_t() noexcept { VariantClear(this); }

    // Extractors convert a copy with VariantChangeType; a failure throws.
    operator short() const;
    operator long() const;
    operator float() const;
    operator double() const;
    operator CY() const;
    operator _bstr_t() const;
    operator IDispatch*() const;
    operator bool() const;
    operator IUnknown*() const;
    operator DECIMAL() const;
    operator BYTE() const;
    operator char() const;
    operator unsigned short() const;
    operator unsigned long() const;
    operator int() const;
    operator unsigned int() const;
    operator long long() const;
    operator unsigned long long() const;

    _variant_t& operator=(const VARIANT& source);
    _variant_t& operator=(const VARIANT* source);
    _variant_t& operator=(const _variant_t& source);
    // A short into VT_BOOL and a long into VT_ERROR or VT_BOOL keep the type.
    _variant_t& operator=(short value);
    _variant_t& operator=(long value);
    _variant_t& operator=(float value);
    // A double into VT_DATE keeps the type.
    _variant_t& operator=(double value);
    _variant_t& operator=(const CY& value);
    _variant_t& operator=(const _bstr_t& value);
    _variant_t& operator=(const OLECHAR* value);
    _variant_t& operator=(const char* value);
    _variant_t& operator=(IDispatch* value);
    _variant_t& operator=(bool value);
    _variant_t& operator=(IUnknown* value);
    _variant_t& operator=(const DECIMAL& value);
    _variant_t& operator=(BYTE value);
    _variant_t& operator=(char value);
    _variant_t& operator=(unsigned short value);
    _variant_t& operator=(unsigned long value);
    _variant_t& operator=(int value);
    _variant_t& operator=(unsigned int value);
    _variant_t& operator=(long long value);
    _variant_t& operator=(unsigned long long value);

    // Same type and value (strings by content, interfaces by identity).
    bool operator==(const VARIANT& other) const noexcept;
    bool operator==(const VARIANT* other) const noexcept;
    bool operator!=(const VARIANT& other) const noexcept { return !(*this == other); }
    bool operator!=(const VARIANT* other) const noexcept { return !(*this == other); }

    void Clear();
    // Takes the variant over (releasing the old content) and empties it.
    void Attach(VARIANT& source);
    VARIANT Detach() noexcept;
    VARIANT& GetVARIANT() noexcept { return *this; }
    VARIANT* GetAddress();
    // Converts in place, or converts a copy of source into this.
    void ChangeType(VARTYPE type, const _variant_t* source = nullptr);
    void SetString(const char* text);

private:
    // Clears unless the variant already has the type, then sets the type.
    void Retype(VARTYPE type);
    VARIANT Converted(VARTYPE type) const;
};
