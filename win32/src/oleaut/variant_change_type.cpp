// VariantChangeType and VariantChangeTypeEx: every scalar variant type into
// every other, as the system changes them for en-US.
#include "oleaut/variant_number.h"

#include <cmath>
#include <cstring>

using namespace vkw32::oleaut;

namespace {

// The first day and the day after the last that a date holds.
constexpr double kDateLow = -657435.0;
constexpr double kDateHigh = 2958466.0;

bool IsIntegerType(VARTYPE vt) {
    switch (vt) {
    case VT_I1:
    case VT_UI1:
    case VT_I2:
    case VT_UI2:
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
    case VT_I8:
    case VT_UI8:
        return true;
    default:
        return false;
    }
}

bool IsScalarType(VARTYPE vt) {
    switch (vt) {
    case VT_EMPTY:
    case VT_NULL:
    case VT_R4:
    case VT_R8:
    case VT_CY:
    case VT_DATE:
    case VT_BSTR:
    case VT_ERROR:
    case VT_BOOL:
    case VT_DECIMAL:
        return true;
    default:
        return IsIntegerType(vt);
    }
}

// Every type code a variant may hold, flags aside.
bool IsKnownBase(VARTYPE vt) {
    return IsScalarType(vt) || vt == VT_DISPATCH || vt == VT_UNKNOWN || vt == VT_VARIANT ||
           vt == VT_RECORD;
}

int BitsOf(VARTYPE vt) {
    switch (vt) {
    case VT_I1:
    case VT_UI1:
        return 8;
    case VT_I2:
    case VT_UI2:
        return 16;
    case VT_I4:
    case VT_UI4:
    case VT_INT:
    case VT_UINT:
        return 32;
    default:
        return 64;
    }
}

bool IsSigned(VARTYPE vt) {
    return vt == VT_I1 || vt == VT_I2 || vt == VT_I4 || vt == VT_INT || vt == VT_I8;
}

Int128 IntegerOf(const VARIANT& value) {
    switch (value.vt) {
    case VT_I1:
        return value.cVal;
    case VT_UI1:
        return value.bVal;
    case VT_I2:
        return value.iVal;
    case VT_UI2:
        return value.uiVal;
    case VT_I4:
    case VT_INT:
        return value.lVal;
    case VT_UI4:
    case VT_UINT:
        return value.ulVal;
    case VT_I8:
        return value.llVal;
    case VT_UI8:
        return value.ullVal;
    case VT_BOOL: // as stored: 1 is a true the system reads as 1
        return value.boolVal;
    default:
        return 0;
    }
}

// The value behind a source, as a bitwise variant of the base type; a
// reference to a variant is read through (one more reference at most).
HRESULT ReadSource(const VARIANT& source, VARIANT* value) {
    const VARTYPE flags = source.vt & ~VT_TYPEMASK;
    const VARTYPE base = source.vt & VT_TYPEMASK;
    if ((flags & ~(VT_BYREF | VT_ARRAY)) || !IsKnownBase(base))
        return DISP_E_BADVARTYPE;
    if (!(flags & VT_BYREF)) {
        *value = source;
        return S_OK;
    }
    if (base == VT_EMPTY || base == VT_NULL)
        return DISP_E_BADVARTYPE;
    if (!source.byref)
        return E_INVALIDARG;
    if (flags & VT_ARRAY) {
        *value = VARIANT{};
        value->vt = VT_ARRAY | base;
        value->parray = *source.pparray;
        return S_OK;
    }
    if (base == VT_VARIANT) {
        const VARIANT& inner = *source.pvarVal;
        if (inner.vt == (VT_VARIANT | VT_BYREF))
            return E_INVALIDARG;
        return ReadSource(inner, value);
    }
    if (base == VT_RECORD)
        return DISP_E_TYPEMISMATCH;
    return LoadReferenced(source, value);
}

// A number on its way between types.
struct Number {
    enum Kind { kInteger, kRadix, kReal, kFloat, kExact } kind = kInteger;
    VARTYPE from = VT_EMPTY; // the source's type
    Int128 integer = 0;      // kInteger; the bits of &H/&O text for kRadix
    double real = 0;         // kReal (VT_R8, VT_DATE) and kFloat (VT_R4)
    DecimalDigits exact;     // kExact: VT_CY, VT_DECIMAL and decimal text
};

bool IsTrueText(const OLECHAR* text, UINT length, const char* word) {
    if (std::strlen(word) != length)
        return false;
    for (UINT i = 0; i < length; ++i) {
        OLECHAR c = text[i];
        if (c >= 'A' && c <= 'Z')
            c = static_cast<OLECHAR>(c - 'A' + 'a');
        if (c != static_cast<unsigned char>(word[i]))
            return false;
    }
    return true;
}

HRESULT NumberOf(const VARIANT& value, Number* number) {
    number->from = value.vt;
    switch (value.vt) {
    case VT_R4:
        number->kind = Number::kFloat;
        number->real = value.fltVal;
        return S_OK;
    case VT_R8:
    case VT_DATE:
        number->kind = Number::kReal;
        number->real = value.dblVal;
        return S_OK;
    case VT_CY:
        number->kind = Number::kExact;
        number->exact = DigitsOfCurrency(value.cyVal.int64);
        return S_OK;
    case VT_DECIMAL:
        if (value.decVal.scale > 28)
            return E_INVALIDARG;
        number->kind = Number::kExact;
        number->exact = DigitsOf(value.decVal);
        return S_OK;
    case VT_BSTR: {
        ParsedNumber parsed;
        const HRESULT hr = ParseNumber(value.bstrVal, SysStringLen(value.bstrVal), &parsed);
        if (FAILED(hr))
            return hr;
        if (parsed.radix) {
            number->kind = Number::kRadix;
            number->integer = parsed.bits;
        } else {
            number->kind = Number::kExact;
            number->exact = parsed.decimal;
        }
        return S_OK;
    }
    default: // VT_EMPTY, VT_BOOL and the integers
        number->kind = Number::kInteger;
        number->integer = IntegerOf(value);
        return S_OK;
    }
}

void StoreInteger(VARTYPE vt, Int128 value, VARIANT* out) {
    out->vt = vt;
    switch (BitsOf(vt)) {
    case 8:
        out->bVal = static_cast<BYTE>(value);
        break;
    case 16:
        out->uiVal = static_cast<USHORT>(value);
        break;
    case 32:
        out->ulVal = static_cast<ULONG>(value);
        break;
    default:
        out->ullVal = static_cast<ULONGLONG>(value);
        break;
    }
}

HRESULT ToInteger(const Number& number, VARTYPE vt, VARIANT* out) {
    const int bits = BitsOf(vt);
    const bool isSigned = IsSigned(vt);
    const Int128 high = isSigned ? (static_cast<Int128>(1) << (bits - 1)) - 1
                                 : (static_cast<Int128>(1) << bits) - 1;
    const Int128 low = isSigned ? -(static_cast<Int128>(1) << (bits - 1)) : 0;
    Int128 value = 0;
    switch (number.kind) {
    case Number::kInteger:
        // Integers of the same width change sign by their bits, and true is
        // all bits set in every unsigned type.
        if ((IsIntegerType(number.from) && BitsOf(number.from) == bits) ||
            (number.from == VT_BOOL && !isSigned)) {
            StoreInteger(vt, number.integer, out);
            return S_OK;
        }
        value = number.integer;
        break;
    case Number::kRadix:
        // The bits fill the type: &HFFFF is VT_I2 -1.
        if (bits < 64 && number.integer >> bits)
            return DISP_E_OVERFLOW;
        StoreInteger(vt, number.integer, out);
        return S_OK;
    case Number::kReal:
    case Number::kFloat: {
        const double rounded = std::nearbyint(number.real);
        const double limit = std::ldexp(1.0, isSigned ? bits - 1 : bits);
        if (!(rounded < limit && rounded >= (isSigned ? -limit : 0.0)))
            return DISP_E_OVERFLOW;
        value = static_cast<Int128>(rounded);
        break;
    }
    case Number::kExact: {
        UInt128 magnitude;
        if (!RoundDigits(number.exact, 0, &magnitude))
            return DISP_E_OVERFLOW;
        value = number.exact.negative ? -static_cast<Int128>(magnitude)
                                      : static_cast<Int128>(magnitude);
        break;
    }
    }
    if (value < low || value > high)
        return DISP_E_OVERFLOW;
    StoreInteger(vt, value, out);
    return S_OK;
}

HRESULT ToCurrency(const Number& number, VARIANT* out) {
    constexpr Int128 kHigh = static_cast<Int128>(0x7fffffffffffffffLL);
    constexpr Int128 kLow = -kHigh - 1;
    Int128 value = 0;
    switch (number.kind) {
    case Number::kInteger:
    case Number::kRadix:
        value = number.integer * 10000;
        break;
    case Number::kReal:
    case Number::kFloat: {
        // In extended precision where there is one, so that the product of a
        // value just above a half unit stays above it (5.0000000000000002e-05).
        const long double scaled = std::nearbyint(number.real * 10000.0L);
        if (!(scaled < 9223372036854775808.0 && scaled >= -9223372036854775808.0))
            return DISP_E_OVERFLOW;
        value = static_cast<Int128>(scaled);
        break;
    }
    case Number::kExact: {
        UInt128 magnitude;
        if (!RoundDigits(number.exact, 4, &magnitude))
            return DISP_E_OVERFLOW;
        value = number.exact.negative ? -static_cast<Int128>(magnitude)
                                      : static_cast<Int128>(magnitude);
        break;
    }
    }
    if (value < kLow || value > kHigh)
        return DISP_E_OVERFLOW;
    out->vt = VT_CY;
    out->cyVal.int64 = static_cast<LONGLONG>(value);
    return S_OK;
}

// The exact digits of a number; a double through its 15 significant digits
// (a float through 7), as the system takes them.
HRESULT DigitsOfNumber(const Number& number, DecimalDigits* digits) {
    switch (number.kind) {
    case Number::kInteger:
    case Number::kRadix:
        *digits = DigitsOf(
            number.integer < 0,
            static_cast<UInt128>(number.integer < 0 ? -number.integer : number.integer), 0);
        return S_OK;
    case Number::kReal:
    case Number::kFloat: {
        if (!std::isfinite(number.real))
            return DISP_E_OVERFLOW;
        // Past 2^53 every double is a whole number: the system keeps all its
        // digits (2^64 is 18446744073709551616, not 1.84467440737096E+19).
        if (std::fabs(number.real) >= 9007199254740992.0) {
            if (std::fabs(number.real) >= 1e30)
                return DISP_E_OVERFLOW;
            *digits = DigitsOf(number.real < 0, static_cast<UInt128>(std::fabs(number.real)), 0);
            return S_OK;
        }
        const std::string text = FormatReal(number.real, number.kind == Number::kReal ? 15 : 7);
        std::basic_string<OLECHAR> wide(text.begin(), text.end());
        ParsedNumber parsed;
        const HRESULT hr = ParseNumber(wide.data(), static_cast<UINT>(wide.size()), &parsed);
        *digits = parsed.decimal;
        return hr;
    }
    case Number::kExact:
        *digits = number.exact;
        return S_OK;
    }
    return E_UNEXPECTED;
}

HRESULT ToDecimal(const Number& number, VARIANT* out) {
    DecimalDigits digits;
    HRESULT hr = DigitsOfNumber(number, &digits);
    if (FAILED(hr))
        return hr;
    DECIMAL result{};
    hr = DecimalFromDigits(digits, &result);
    if (FAILED(hr))
        return hr;
    out->decVal = result;
    out->vt = VT_DECIMAL;
    return S_OK;
}

// The nearest double (or float, for VT_R4), infinite out of range.
double RealOf(const Number& number, bool asFloat) {
    switch (number.kind) {
    case Number::kInteger:
    case Number::kRadix:
        return asFloat ? static_cast<double>(static_cast<float>(number.integer))
                       : static_cast<double>(number.integer);
    case Number::kReal:
    case Number::kFloat:
        return asFloat ? static_cast<double>(static_cast<float>(number.real)) : number.real;
    case Number::kExact:
        return asFloat ? static_cast<double>(FloatFromDigits(number.exact))
                       : DoubleFromDigits(number.exact);
    }
    return 0;
}

HRESULT ToReal(const Number& number, VARTYPE vt, VARIANT* out) {
    const double value = RealOf(number, vt == VT_R4);
    if (std::isinf(value) &&
        !(number.kind >= Number::kReal && number.kind <= Number::kFloat && std::isinf(number.real)))
        return DISP_E_OVERFLOW;
    if (vt == VT_DATE && !(value > kDateLow && value < kDateHigh))
        return DISP_E_OVERFLOW;
    out->vt = vt;
    if (vt == VT_R4)
        out->fltVal = static_cast<float>(value);
    else
        out->dblVal = value;
    return S_OK;
}

HRESULT ToBool(const Number& number, VARIANT* out) {
    bool value = false;
    switch (number.kind) {
    case Number::kInteger:
    case Number::kRadix:
        value = number.integer != 0;
        break;
    case Number::kReal:
    case Number::kFloat:
        value = number.real != 0;
        break;
    case Number::kExact:
        if (number.from == VT_BSTR && std::isinf(DoubleFromDigits(number.exact)))
            return DISP_E_OVERFLOW;
        value = !IsZero(number.exact);
        break;
    }
    out->vt = VT_BOOL;
    out->boolVal = value ? VARIANT_TRUE : VARIANT_FALSE;
    return S_OK;
}

HRESULT ToText(const Number& number, LCID lcid, USHORT flags, VARIANT* out) {
    std::string text;
    switch (number.from) {
    case VT_EMPTY:
        break;
    case VT_DATE: {
        BSTR date = nullptr;
        const HRESULT hr = VarBstrFromDate(number.real, lcid, 0, &date);
        if (FAILED(hr))
            return hr;
        out->vt = VT_BSTR;
        out->bstrVal = date;
        return S_OK;
    }
    case VT_BOOL:
        if (flags & (VARIANT_ALPHABOOL | VARIANT_LOCALBOOL)) {
            text = number.integer ? "True" : "False";
            break;
        }
        text = FormatInteger(number.integer);
        break;
    case VT_R4:
    case VT_R8:
        text = FormatReal(number.real, number.from == VT_R8 ? 15 : 7);
        break;
    case VT_CY:
    case VT_DECIMAL:
        text = FormatDigits(number.exact);
        break;
    default:
        text = FormatInteger(number.integer);
        break;
    }
    BSTR result;
    const HRESULT hr = TextToBstr(text, &result);
    if (FAILED(hr))
        return hr;
    out->vt = VT_BSTR;
    out->bstrVal = result;
    return S_OK;
}

HRESULT FromText(BSTR text, LCID lcid, USHORT flags, VARTYPE vt, VARIANT* out) {
    if (vt == VT_DATE) {
        // VarDateFromStr needs a terminated text; a null BSTR is "".
        static const OLECHAR kEmpty[1] = {0};
        DATE date;
        const HRESULT hr = VarDateFromStr(text ? text : kEmpty, lcid, 0, &date);
        if (FAILED(hr))
            return hr;
        out->vt = VT_DATE;
        out->date = date;
        return S_OK;
    }
    const UINT length = SysStringLen(text);
    if (vt == VT_BOOL) {
        const bool isTrue = IsTrueText(text, length, "true") || IsTrueText(text, length, "#true#");
        if (isTrue || IsTrueText(text, length, "false") || IsTrueText(text, length, "#false#")) {
            out->vt = VT_BOOL;
            out->boolVal = isTrue ? VARIANT_TRUE : VARIANT_FALSE;
            return S_OK;
        }
    }
    (void)flags;
    VARIANT source{};
    source.vt = VT_BSTR;
    source.bstrVal = text;
    Number number;
    const HRESULT hr = NumberOf(source, &number);
    if (FAILED(hr))
        return hr;
    switch (vt) {
    case VT_BOOL:
        return ToBool(number, out);
    case VT_CY:
        return ToCurrency(number, out);
    case VT_DECIMAL:
        return ToDecimal(number, out);
    case VT_R4:
    case VT_R8:
        return ToReal(number, vt, out);
    default:
        return ToInteger(number, vt, out);
    }
}

// Builds the changed value in *out, which owns it on success.
HRESULT Change(const VARIANT& source, LCID lcid, USHORT flags, VARTYPE vt, VARIANT* out) {
    VARIANT value;
    HRESULT hr = ReadSource(source, &value);
    if (FAILED(hr))
        return hr;
    const VARTYPE base = vt & VT_TYPEMASK;
    if (!IsKnownBase(base) && base != VT_VARIANT)
        return DISP_E_BADVARTYPE;
    if ((vt & ~VT_TYPEMASK) || (value.vt & ~VT_TYPEMASK) || base == VT_VARIANT ||
        base == VT_RECORD || value.vt == VT_RECORD || value.vt == VT_VARIANT)
        return DISP_E_TYPEMISMATCH;

    const VARTYPE from = value.vt;
    if (from == vt)
        return VariantCopy(out, &value);
    if (from == VT_ERROR || vt == VT_ERROR)
        return DISP_E_TYPEMISMATCH;
    if (vt == VT_NULL || vt == VT_EMPTY) {
        if (from == VT_NULL)
            return DISP_E_TYPEMISMATCH;
        out->vt = vt;
        return S_OK;
    }
    if (from == VT_NULL)
        return DISP_E_TYPEMISMATCH;

    if (from == VT_UNKNOWN || from == VT_DISPATCH) {
        if (vt != VT_UNKNOWN && vt != VT_DISPATCH)
            return DISP_E_TYPEMISMATCH; // IDispatch::Invoke(DISPID_VALUE) is not called
        void* object = nullptr;
        if (value.punkVal) {
            hr = value.punkVal->QueryInterface(vt == VT_DISPATCH ? IID_IDispatch : IID_IUnknown,
                                               &object);
            if (FAILED(hr))
                return hr;
        }
        out->vt = vt;
        out->punkVal = static_cast<IUnknown*>(object);
        return S_OK;
    }
    if (vt == VT_UNKNOWN || vt == VT_DISPATCH)
        return DISP_E_TYPEMISMATCH;

    if ((from == VT_BSTR || vt == VT_BSTR) && !IsKnownLocale(lcid))
        return E_INVALIDARG;
    if (from == VT_BSTR)
        return FromText(value.bstrVal, lcid, flags, vt, out);

    Number number;
    hr = NumberOf(value, &number);
    if (FAILED(hr))
        return hr;
    switch (vt) {
    case VT_BSTR:
        return ToText(number, lcid, flags, out);
    case VT_BOOL:
        return ToBool(number, out);
    case VT_CY:
        return ToCurrency(number, out);
    case VT_DECIMAL:
        return ToDecimal(number, out);
    case VT_R4:
    case VT_R8:
    case VT_DATE:
        return ToReal(number, vt, out);
    default:
        return ToInteger(number, vt, out);
    }
}

} // namespace

extern "C" {

HRESULT WINAPI VariantChangeTypeEx(VARIANTARG* dest, const VARIANTARG* src, LCID lcid, USHORT flags,
                                   VARTYPE vt) {
    if (!dest || !src)
        return E_INVALIDARG;
    VARIANT result;
    VariantInit(&result);
    const HRESULT hr = Change(*src, lcid, flags, vt, &result);
    if (FAILED(hr))
        return hr;
    // The source is no longer needed: the destination may be the source.
    const HRESULT cleared = VariantClear(dest);
    if (FAILED(cleared)) {
        VariantClear(&result);
        return cleared;
    }
    *dest = result;
    return S_OK;
}

HRESULT WINAPI VariantChangeType(VARIANTARG* dest, const VARIANTARG* src, USHORT flags,
                                 VARTYPE vt) {
    return VariantChangeTypeEx(dest, src, LOCALE_USER_DEFAULT, flags, vt);
}

} // extern "C"
