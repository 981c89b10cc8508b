// _variant_t: a VARIANT that owns its content.
#include <vkwin32/comdef.h>

#include <cstring>
#include <limits>

namespace {

LONG Narrow(long value) {
    if (value < std::numeric_limits<LONG>::min() || value > std::numeric_limits<LONG>::max())
        _com_issue_error(DISP_E_OVERFLOW);
    return static_cast<LONG>(value);
}

ULONG Narrow(unsigned long value) {
    if (value > std::numeric_limits<ULONG>::max())
        _com_issue_error(DISP_E_OVERFLOW);
    return static_cast<ULONG>(value);
}

BSTR NewString(const OLECHAR* text) {
    BSTR string = SysAllocString(text);
    if (!string && text)
        _com_issue_error(E_OUTOFMEMORY);
    return string;
}

} // namespace

_variant_t::_variant_t(const VARIANT& source) {
    VariantInit(this);
    _com_util::CheckError(VariantCopy(this, &source));
}

_variant_t::_variant_t(const VARIANT* source) {
    if (!source)
        _com_issue_error(E_POINTER);
    VariantInit(this);
    _com_util::CheckError(VariantCopy(this, source));
}

_variant_t::_variant_t(const _variant_t& source) : _variant_t(static_cast<const VARIANT&>(source)) {}

_variant_t::_variant_t(VARIANT& source, bool copy) {
    VariantInit(this);
    if (copy) {
        _com_util::CheckError(VariantCopy(this, &source));
    } else {
        std::memcpy(static_cast<VARIANT*>(this), &source, sizeof(VARIANT));
        source.vt = VT_EMPTY;
    }
}

_variant_t::_variant_t(short value, VARTYPE type) {
    VariantInit(this);
    if (type == VT_I2)
        iVal = value;
    else if (type == VT_BOOL)
        boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    else
        _com_issue_error(E_INVALIDARG);
    vt = type;
}

_variant_t::_variant_t(long value, VARTYPE type) {
    VariantInit(this);
    if (type == VT_I4)
        lVal = Narrow(value);
    else if (type == VT_ERROR)
        scode = Narrow(value);
    else if (type == VT_BOOL)
        boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    else
        _com_issue_error(E_INVALIDARG);
    vt = type;
}

_variant_t::_variant_t(float value) noexcept {
    VariantInit(this);
    vt = VT_R4;
    fltVal = value;
}

_variant_t::_variant_t(double value, VARTYPE type) {
    VariantInit(this);
    if (type != VT_R8 && type != VT_DATE)
        _com_issue_error(E_INVALIDARG);
    vt = type;
    dblVal = value;
}

_variant_t::_variant_t(const CY& value) noexcept {
    VariantInit(this);
    vt = VT_CY;
    cyVal = value;
}

_variant_t::_variant_t(const _bstr_t& value) {
    VariantInit(this);
    bstrVal = value.copy();
    vt = VT_BSTR;
}

_variant_t::_variant_t(const OLECHAR* value) {
    VariantInit(this);
    bstrVal = NewString(value);
    vt = VT_BSTR;
}

_variant_t::_variant_t(const char* value) {
    VariantInit(this);
    bstrVal = _com_util::ConvertStringToBSTR(value);
    vt = VT_BSTR;
}

_variant_t::_variant_t(IDispatch* value, bool addRef) noexcept {
    VariantInit(this);
    vt = VT_DISPATCH;
    pdispVal = value;
    if (value && addRef)
        value->AddRef();
}

_variant_t::_variant_t(bool value) noexcept {
    VariantInit(this);
    vt = VT_BOOL;
    boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
}

_variant_t::_variant_t(IUnknown* value, bool addRef) noexcept {
    VariantInit(this);
    vt = VT_UNKNOWN;
    punkVal = value;
    if (value && addRef)
        value->AddRef();
}

_variant_t::_variant_t(const DECIMAL& value) noexcept {
    decVal = value;
    vt = VT_DECIMAL;
}

_variant_t::_variant_t(BYTE value) noexcept {
    VariantInit(this);
    vt = VT_UI1;
    bVal = value;
}

_variant_t::_variant_t(char value) noexcept {
    VariantInit(this);
    vt = VT_I1;
    cVal = value;
}

_variant_t::_variant_t(unsigned short value) noexcept {
    VariantInit(this);
    vt = VT_UI2;
    uiVal = value;
}

_variant_t::_variant_t(unsigned long value) {
    VariantInit(this);
    ulVal = Narrow(value);
    vt = VT_UI4;
}

_variant_t::_variant_t(int value) noexcept {
    VariantInit(this);
    vt = VT_INT;
    intVal = value;
}

_variant_t::_variant_t(unsigned int value) noexcept {
    VariantInit(this);
    vt = VT_UINT;
    uintVal = value;
}

_variant_t::_variant_t(long long value) noexcept {
    VariantInit(this);
    vt = VT_I8;
    llVal = value;
}

_variant_t::_variant_t(unsigned long long value) noexcept {
    VariantInit(this);
    vt = VT_UI8;
    ullVal = value;
}

VARIANT _variant_t::Converted(VARTYPE type) const {
    VARIANT result;
    VariantInit(&result);
    _com_util::CheckError(VariantChangeType(&result, this, 0, type));
    return result;
}

_variant_t::operator short() const {
    return vt == VT_I2 ? iVal : Converted(VT_I2).iVal;
}

_variant_t::operator long() const {
    return vt == VT_I4 ? lVal : Converted(VT_I4).lVal;
}

_variant_t::operator float() const {
    return vt == VT_R4 ? fltVal : Converted(VT_R4).fltVal;
}

_variant_t::operator double() const {
    return vt == VT_R8 ? dblVal : Converted(VT_R8).dblVal;
}

_variant_t::operator CY() const {
    return vt == VT_CY ? cyVal : Converted(VT_CY).cyVal;
}

_variant_t::operator _bstr_t() const {
    if (vt == VT_BSTR)
        return _bstr_t(bstrVal, true);
    return _bstr_t(Converted(VT_BSTR).bstrVal, false);
}

_variant_t::operator IDispatch*() const {
    if (vt == VT_DISPATCH) {
        if (pdispVal)
            pdispVal->AddRef();
        return pdispVal;
    }
    // The converted variant's reference passes to the caller.
    return Converted(VT_DISPATCH).pdispVal;
}

_variant_t::operator bool() const {
    return (vt == VT_BOOL ? boolVal : Converted(VT_BOOL).boolVal) != VARIANT_FALSE;
}

_variant_t::operator IUnknown*() const {
    if (vt == VT_UNKNOWN) {
        if (punkVal)
            punkVal->AddRef();
        return punkVal;
    }
    return Converted(VT_UNKNOWN).punkVal;
}

_variant_t::operator DECIMAL() const {
    return vt == VT_DECIMAL ? decVal : Converted(VT_DECIMAL).decVal;
}

_variant_t::operator BYTE() const {
    return vt == VT_UI1 ? bVal : Converted(VT_UI1).bVal;
}

_variant_t::operator char() const {
    return vt == VT_I1 ? cVal : Converted(VT_I1).cVal;
}

_variant_t::operator unsigned short() const {
    return vt == VT_UI2 ? uiVal : Converted(VT_UI2).uiVal;
}

_variant_t::operator unsigned long() const {
    return vt == VT_UI4 ? ulVal : Converted(VT_UI4).ulVal;
}

_variant_t::operator int() const {
    return vt == VT_INT ? intVal : Converted(VT_INT).intVal;
}

_variant_t::operator unsigned int() const {
    return vt == VT_UINT ? uintVal : Converted(VT_UINT).uintVal;
}

_variant_t::operator long long() const {
    return vt == VT_I8 ? llVal : Converted(VT_I8).llVal;
}

_variant_t::operator unsigned long long() const {
    return vt == VT_UI8 ? ullVal : Converted(VT_UI8).ullVal;
}

void _variant_t::Retype(VARTYPE type) {
    if (vt != type) {
        Clear();
        vt = type;
    }
}

_variant_t& _variant_t::operator=(const VARIANT& source) {
    _com_util::CheckError(VariantCopy(this, &source));
    return *this;
}

_variant_t& _variant_t::operator=(const VARIANT* source) {
    if (!source)
        _com_issue_error(E_POINTER);
    return *this = *source;
}

_variant_t& _variant_t::operator=(const _variant_t& source) {
    return *this = static_cast<const VARIANT&>(source);
}

_variant_t& _variant_t::operator=(short value) {
    if (vt == VT_BOOL) {
        boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    } else {
        Retype(VT_I2);
        iVal = value;
    }
    return *this;
}

_variant_t& _variant_t::operator=(long value) {
    if (vt == VT_BOOL) {
        boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    } else if (vt == VT_ERROR) {
        scode = Narrow(value);
    } else {
        const LONG narrow = Narrow(value);
        Retype(VT_I4);
        lVal = narrow;
    }
    return *this;
}

_variant_t& _variant_t::operator=(float value) {
    Retype(VT_R4);
    fltVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(double value) {
    if (vt != VT_DATE)
        Retype(VT_R8);
    dblVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(const CY& value) {
    Retype(VT_CY);
    cyVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(const _bstr_t& value) {
    BSTR copy = value.copy();
    Clear();
    vt = VT_BSTR;
    bstrVal = copy;
    return *this;
}

_variant_t& _variant_t::operator=(const OLECHAR* value) {
    BSTR copy = NewString(value);
    Clear();
    vt = VT_BSTR;
    bstrVal = copy;
    return *this;
}

_variant_t& _variant_t::operator=(const char* value) {
    BSTR copy = _com_util::ConvertStringToBSTR(value);
    Clear();
    vt = VT_BSTR;
    bstrVal = copy;
    return *this;
}

_variant_t& _variant_t::operator=(IDispatch* value) {
    // The reference is taken first, so assigning the held pointer keeps it alive.
    if (value)
        value->AddRef();
    Clear();
    vt = VT_DISPATCH;
    pdispVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(bool value) {
    Retype(VT_BOOL);
    boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    return *this;
}

_variant_t& _variant_t::operator=(IUnknown* value) {
    if (value)
        value->AddRef();
    Clear();
    vt = VT_UNKNOWN;
    punkVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(const DECIMAL& value) {
    Clear();
    decVal = value;
    vt = VT_DECIMAL;
    return *this;
}

_variant_t& _variant_t::operator=(BYTE value) {
    Retype(VT_UI1);
    bVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(char value) {
    Retype(VT_I1);
    cVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(unsigned short value) {
    Retype(VT_UI2);
    uiVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(unsigned long value) {
    const ULONG narrow = Narrow(value);
    Retype(VT_UI4);
    ulVal = narrow;
    return *this;
}

_variant_t& _variant_t::operator=(int value) {
    Retype(VT_INT);
    intVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(unsigned int value) {
    Retype(VT_UINT);
    uintVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(long long value) {
    Retype(VT_I8);
    llVal = value;
    return *this;
}

_variant_t& _variant_t::operator=(unsigned long long value) {
    Retype(VT_UI8);
    ullVal = value;
    return *this;
}

bool _variant_t::operator==(const VARIANT& other) const noexcept {
    if (this == &other)
        return true;
    if (vt != other.vt)
        return false;
    switch (vt) {
    case VT_EMPTY:
    case VT_NULL:
        return true;
    case VT_I1:
    case VT_UI1:
        return bVal == other.bVal;
    case VT_I2:
    case VT_UI2:
    case VT_BOOL:
        return iVal == other.iVal;
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
    case VT_ERROR:
        return lVal == other.lVal;
    case VT_R4:
        return fltVal == other.fltVal;
    case VT_R8:
    case VT_DATE:
        return dblVal == other.dblVal;
    case VT_I8:
    case VT_UI8:
    case VT_CY:
        return llVal == other.llVal;
    case VT_DECIMAL:
        return decVal.scale == other.decVal.scale && decVal.sign == other.decVal.sign &&
               decVal.Hi32 == other.decVal.Hi32 && decVal.Lo64 == other.decVal.Lo64;
    case VT_BSTR: {
        const UINT bytes = SysStringByteLen(bstrVal);
        return bytes == SysStringByteLen(other.bstrVal) &&
               (bytes == 0 || std::memcmp(bstrVal, other.bstrVal, bytes) == 0);
    }
    case VT_UNKNOWN:
    case VT_DISPATCH:
        return punkVal == other.punkVal;
    default:
        return false;
    }
}

bool _variant_t::operator==(const VARIANT* other) const noexcept {
    return other && *this == *other;
}

void _variant_t::Clear() {
    _com_util::CheckError(VariantClear(this));
}

void _variant_t::Attach(VARIANT& source) {
    Clear();
    std::memcpy(static_cast<VARIANT*>(this), &source, sizeof(VARIANT));
    source.vt = VT_EMPTY;
}

VARIANT _variant_t::Detach() noexcept {
    VARIANT result;
    std::memcpy(&result, static_cast<VARIANT*>(this), sizeof(VARIANT));
    vt = VT_EMPTY;
    return result;
}

VARIANT* _variant_t::GetAddress() {
    Clear();
    return this;
}

void _variant_t::ChangeType(VARTYPE type, const _variant_t* source) {
    if (!source)
        source = this;
    if (source != this || type != vt)
        _com_util::CheckError(VariantChangeType(this, source, 0, type));
}

void _variant_t::SetString(const char* text) {
    *this = text;
}
