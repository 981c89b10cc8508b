#include "text/wide_string.h"

#include <vaskel/value.h>

#include <cmath>
#include <cstring>
#include <limits>

namespace vaskel {

namespace {

[[noreturn]] void Throw(HRESULT hr) {
    throw _com_error(hr);
}

void Check(HRESULT hr) {
    if (FAILED(hr))
        Throw(hr);
}

// Some SDKs declare the source without const; it is only read.
HRESULT Copy(VARIANT* destination, const VARIANT* source) {
    return VariantCopy(destination, const_cast<VARIANT*>(source));
}

LONG Narrow(long value) {
    if (value < std::numeric_limits<LONG>::min() || value > std::numeric_limits<LONG>::max())
        Throw(DISP_E_OVERFLOW);
    return static_cast<LONG>(value);
}

ULONG Narrow(unsigned long value) {
    if (value > std::numeric_limits<ULONG>::max())
        Throw(DISP_E_OVERFLOW);
    return static_cast<ULONG>(value);
}

VARIANT_BOOL AsBool(bool value) {
    return value ? VARIANT_TRUE : VARIANT_FALSE;
}

BSTR NewString(const OLECHAR* text) {
    BSTR string = SysAllocString(text);
    if (!string && text)
        Throw(E_OUTOFMEMORY);
    return string;
}

BSTR NewString(const char* text) {
    WideString string(text, CP_ACP);
    if (FAILED(string.Status()))
        Throw(string.Status());
    return string.Detach();
}

// Byte-exact, so an odd byte length and embedded NULs survive; throws
// E_OUTOFMEMORY.
BSTR NewString(const _bstr_t& text) {
    return text.copy();
}

CString TextOf(BSTR text) {
    return text ? CString(text) : CString();
}

} // namespace

orvariant_t::orvariant_t(const orvariant_t& source) : orvariant_t(static_cast<const VARIANT&>(source)) {}

orvariant_t::orvariant_t(const VARIANT& source) {
    VariantInit(this);
    Check(Copy(this, &source));
}

orvariant_t::orvariant_t(const _variant_t& source) : orvariant_t(static_cast<const VARIANT&>(source)) {}

orvariant_t::orvariant_t(const VARIANT* source) {
    VariantInit(this);
    if (!source)
        Throw(E_POINTER);
    Check(Copy(this, source));
}

orvariant_t::orvariant_t(VARIANT& source, bool copy) {
    VariantInit(this);
    if (copy) {
        Check(Copy(this, &source));
    } else {
        std::memcpy(static_cast<VARIANT*>(this), &source, sizeof(VARIANT));
        source.vt = VT_EMPTY;
    }
}

orvariant_t::orvariant_t(short value, VARTYPE type) {
    VariantInit(this);
    if (type == VT_I2)
        iVal = value;
    else if (type == VT_BOOL)
        boolVal = AsBool(value != 0);
    else
        Throw(E_INVALIDARG);
    vt = type;
}

orvariant_t::orvariant_t(long value, VARTYPE type) {
    VariantInit(this);
    if (type == VT_I4)
        lVal = Narrow(value);
    else if (type == VT_ERROR)
        scode = Narrow(value);
    else if (type == VT_BOOL)
        boolVal = AsBool(value != 0);
    else
        Throw(E_INVALIDARG);
    vt = type;
}

orvariant_t::orvariant_t(float value) noexcept {
    VariantInit(this);
    vt = VT_R4;
    fltVal = value;
}

orvariant_t::orvariant_t(double value, VARTYPE type) {
    VariantInit(this);
    if (type != VT_R8 && type != VT_DATE)
        Throw(E_INVALIDARG);
    vt = type;
    dblVal = value;
}

orvariant_t::orvariant_t(const CDateTime& value) noexcept {
    VariantInit(this);
    vt = VT_DATE;
    date = value.GetValue();
}

orvariant_t::orvariant_t(const CY& value) noexcept {
    VariantInit(this);
    vt = VT_CY;
    cyVal = value;
}

orvariant_t::orvariant_t(const OLECHAR* value) {
    VariantInit(this);
    bstrVal = NewString(value);
    vt = VT_BSTR;
}

orvariant_t::orvariant_t(const char* value) {
    VariantInit(this);
    bstrVal = NewString(value);
    vt = VT_BSTR;
}

orvariant_t::orvariant_t(const _bstr_t& value) {
    VariantInit(this);
    bstrVal = NewString(value);
    vt = VT_BSTR;
}

orvariant_t::orvariant_t(IDispatch* value, bool addRef) noexcept {
    VariantInit(this);
    vt = VT_DISPATCH;
    pdispVal = value;
    if (value && addRef)
        value->AddRef();
}

orvariant_t::orvariant_t(IUnknown* value, bool addRef) noexcept {
    VariantInit(this);
    vt = VT_UNKNOWN;
    punkVal = value;
    if (value && addRef)
        value->AddRef();
}

orvariant_t::orvariant_t(bool value) noexcept {
    VariantInit(this);
    vt = VT_BOOL;
    boolVal = AsBool(value);
}

orvariant_t::orvariant_t(const DECIMAL& value) noexcept {
    decVal = value;
    vt = VT_DECIMAL;
}

orvariant_t::orvariant_t(unsigned char value) noexcept {
    VariantInit(this);
    vt = VT_UI1;
    bVal = value;
}

orvariant_t::orvariant_t(char value) noexcept {
    VariantInit(this);
    vt = VT_I1;
    cVal = value;
}

orvariant_t::orvariant_t(unsigned short value) noexcept {
    VariantInit(this);
    vt = VT_UI2;
    uiVal = value;
}

orvariant_t::orvariant_t(unsigned long value) {
    VariantInit(this);
    ulVal = Narrow(value);
    vt = VT_UI4;
}

orvariant_t::orvariant_t(int value) noexcept {
    VariantInit(this);
    vt = VT_INT;
    intVal = value;
}

orvariant_t::orvariant_t(unsigned int value) noexcept {
    VariantInit(this);
    vt = VT_UINT;
    uintVal = value;
}

orvariant_t::orvariant_t(long long value) noexcept {
    VariantInit(this);
    vt = VT_I8;
    llVal = value;
}

orvariant_t::orvariant_t(unsigned long long value) noexcept {
    VariantInit(this);
    vt = VT_UI8;
    ullVal = value;
}

void orvariant_t::Retype(VARTYPE type) {
    if (vt != type) {
        Check(VariantClear(this));
        vt = type;
    }
}

void orvariant_t::SetString(BSTR owned) {
    const HRESULT hr = VariantClear(this);
    if (FAILED(hr)) {
        SysFreeString(owned);
        Throw(hr);
    }
    vt = VT_BSTR;
    bstrVal = owned;
}

orvariant_t& orvariant_t::operator=(const orvariant_t& source) {
    return *this = static_cast<const VARIANT&>(source);
}

orvariant_t& orvariant_t::operator=(const VARIANT& source) {
    // Copying onto itself would clear the source before reading it.
    if (&source != this)
        Check(Copy(this, &source));
    return *this;
}

orvariant_t& orvariant_t::operator=(const _variant_t& source) {
    return *this = static_cast<const VARIANT&>(source);
}

orvariant_t& orvariant_t::operator=(const VARIANT* source) {
    if (!source)
        Throw(E_POINTER);
    return *this = *source;
}

orvariant_t& orvariant_t::operator=(short value) {
    if (vt == VT_BOOL) {
        boolVal = AsBool(value != 0);
    } else {
        Retype(VT_I2);
        iVal = value;
    }
    return *this;
}

orvariant_t& orvariant_t::operator=(long value) {
    if (vt == VT_BOOL) {
        boolVal = AsBool(value != 0);
    } else if (vt == VT_ERROR) {
        scode = Narrow(value);
    } else {
        const LONG narrow = Narrow(value);
        Retype(VT_I4);
        lVal = narrow;
    }
    return *this;
}

orvariant_t& orvariant_t::operator=(double value) {
    if (vt != VT_DATE)
        Retype(VT_R8);
    dblVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(float value) {
    Retype(VT_R4);
    fltVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(const CDateTime& value) {
    Retype(VT_DATE);
    date = value.GetValue();
    return *this;
}

orvariant_t& orvariant_t::operator=(const CY& value) {
    Retype(VT_CY);
    cyVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(bool value) {
    Retype(VT_BOOL);
    boolVal = AsBool(value);
    return *this;
}

orvariant_t& orvariant_t::operator=(const DECIMAL& value) {
    Retype(VT_DECIMAL);
    decVal = value;
    vt = VT_DECIMAL;
    return *this;
}

orvariant_t& orvariant_t::operator=(unsigned char value) {
    Retype(VT_UI1);
    bVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(char value) {
    Retype(VT_I1);
    cVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(unsigned short value) {
    Retype(VT_UI2);
    uiVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(unsigned long value) {
    const ULONG narrow = Narrow(value);
    Retype(VT_UI4);
    ulVal = narrow;
    return *this;
}

orvariant_t& orvariant_t::operator=(int value) {
    Retype(VT_INT);
    intVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(unsigned int value) {
    Retype(VT_UINT);
    uintVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(long long value) {
    Retype(VT_I8);
    llVal = value;
    return *this;
}

orvariant_t& orvariant_t::operator=(unsigned long long value) {
    Retype(VT_UI8);
    ullVal = value;
    return *this;
}

// The new string is made before the old content goes, so a failure leaves
// the wrapper as it was.
orvariant_t& orvariant_t::operator=(const OLECHAR* value) {
    SetString(NewString(value));
    return *this;
}

orvariant_t& orvariant_t::operator=(const char* value) {
    SetString(NewString(value));
    return *this;
}

orvariant_t& orvariant_t::operator=(const _bstr_t& value) {
    SetString(NewString(value));
    return *this;
}

// The reference is taken first, so assigning the held pointer keeps it alive.
void orvariant_t::SetInterface(VARTYPE type, IUnknown* value) {
    if (value)
        value->AddRef();
    const HRESULT hr = VariantClear(this);
    if (FAILED(hr)) {
        if (value)
            value->Release();
        Throw(hr);
    }
    vt = type;
    punkVal = value;
}

orvariant_t& orvariant_t::operator=(IDispatch* value) {
    SetInterface(VT_DISPATCH, value);
    return *this;
}

orvariant_t& orvariant_t::operator=(IUnknown* value) {
    SetInterface(VT_UNKNOWN, value);
    return *this;
}

void orvariant_t::TransferOwnership(VARIANT& source) {
    if (&source == this)
        return;
    Check(VariantClear(this));
    std::memcpy(static_cast<VARIANT*>(this), &source, sizeof(VARIANT));
    source.vt = VT_EMPTY;
}

BSTR orvariant_t::GetBSTR(bool mustMatch) const {
    if (vt == VT_BSTR)
        return bstrVal;
    if (mustMatch)
        Throw(DISP_E_TYPEMISMATCH);
    return nullptr;
}

IDispatch* orvariant_t::GetIDispatch(bool mustMatch) const {
    if (vt == VT_DISPATCH)
        return pdispVal;
    if (mustMatch)
        Throw(DISP_E_TYPEMISMATCH);
    return nullptr;
}

IUnknown* orvariant_t::GetIUnknown(bool mustMatch) const {
    if (vt == VT_UNKNOWN)
        return punkVal;
    if (vt == VT_DISPATCH)
        return pdispVal;
    if (mustMatch)
        Throw(DISP_E_TYPEMISMATCH);
    return nullptr;
}

double orvariant_t::GetAsDouble() const {
    switch (vt) {
    case VT_I2:
    case VT_BOOL:
        return iVal;
    case VT_I4:
    case VT_INT:
        return lVal;
    case VT_R4:
        return fltVal;
    case VT_R8:
    case VT_DATE:
        return dblVal;
    case VT_I1:
        return static_cast<signed char>(cVal);
    case VT_UI1:
        return bVal;
    case VT_UI2:
        return uiVal;
    case VT_UI4:
    case VT_UINT:
        return ulVal;
    case VT_I8:
        return static_cast<double>(llVal);
    case VT_UI8:
        return static_cast<double>(ullVal);
    default:
        return 0.0;
    }
}

namespace {

// Truncation toward zero to 64 bits, kept modulo 2^64 so that every double
// gives a defined result (NaN and values beyond 64 bits give 0).
ULONGLONG Truncated(double value) {
    const double whole = std::trunc(value);
    if (!(std::fabs(whole) < 18446744073709551616.0))
        return 0;
    if (whole >= 9223372036854775808.0)
        return static_cast<ULONGLONG>(whole);
    return static_cast<ULONGLONG>(static_cast<LONGLONG>(whole));
}

} // namespace

LONG orvariant_t::GetAsIntegral() const {
    return static_cast<LONG>(static_cast<DWORD>(Truncated(GetAsDouble())));
}

DWORD orvariant_t::GetAsUnsignedIntegral() const {
    return static_cast<DWORD>(Truncated(GetAsDouble()));
}

CString orvariant_t::GetAsString() const {
    return vt == VT_BSTR ? TextOf(bstrVal) : CString();
}

CString orvariant_t::ToString() const {
    if (IsString())
        return GetAsString();
    orvariant_t text;
    Check(VariantChangeType(&text, const_cast<orvariant_t*>(this), 0, VT_BSTR));
    return TextOf(text.bstrVal);
}

bool orvariant_t::operator<(const orvariant_t& other) const {
    return VarCmp(const_cast<orvariant_t*>(this), const_cast<orvariant_t*>(&other), 0, 0) ==
           VARCMP_LT;
}

} // namespace vaskel
