// VarCmp: numbers by value, texts by their code units.
#include "oleaut/variant_number.h"

#include <cmath>

using namespace vkw32::oleaut;

namespace {

enum class Class { kBad, kUncomparable, kError, kNull, kText, kInteger, kReal, kFloat, kExact };

// The value behind an operand, read through a reference.
HRESULT Read(const VARIANT& operand, VARIANT* value) {
    if (!(operand.vt & VT_BYREF)) {
        *value = operand;
        return S_OK;
    }
    if (operand.vt & VT_ARRAY)
        return DISP_E_BADVARTYPE;
    if (!operand.byref)
        return E_INVALIDARG;
    const VARTYPE base = operand.vt & VT_TYPEMASK;
    // One level of reference, and a reference to a variant that holds a
    // value by reference.
    if (base == VT_VARIANT) {
        const VARIANT& inner = *operand.pvarVal;
        if (inner.vt == (VT_VARIANT | VT_BYREF))
            return E_INVALIDARG;
        return Read(inner, value);
    }
    return LoadReferenced(operand, value);
}

Class ClassOf(VARTYPE vt) {
    if (vt & ~VT_TYPEMASK)
        return Class::kBad;
    switch (vt) {
    case VT_NULL:
        return Class::kNull;
    case VT_BSTR:
        return Class::kText;
    case VT_ERROR:
        return Class::kError;
    case VT_EMPTY:
    case VT_BOOL:
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
        return Class::kInteger;
    case VT_R8:
    case VT_DATE:
        return Class::kReal;
    case VT_R4:
        return Class::kFloat;
    case VT_CY:
    case VT_DECIMAL:
        return Class::kExact;
    case VT_DISPATCH:
    case VT_UNKNOWN:
    case VT_VARIANT:
    case 15:
        return Class::kUncomparable;
    default:
        return Class::kBad;
    }
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
    case VT_BOOL:
        return value.boolVal ? -1 : 0;
    default:
        return 0;
    }
}

double RealOf(const VARIANT& value, Class type) {
    switch (type) {
    case Class::kReal:
        return value.dblVal;
    case Class::kFloat:
        return value.fltVal;
    case Class::kExact:
        return DoubleFromDigits(value.vt == VT_CY ? DigitsOfCurrency(value.cyVal.int64)
                                                  : DigitsOf(value.decVal));
    default:
        return static_cast<double>(IntegerOf(value));
    }
}

DecimalDigits ExactOf(const VARIANT& value) {
    if (value.vt == VT_CY)
        return DigitsOfCurrency(value.cyVal.int64);
    if (value.vt == VT_DECIMAL)
        return DigitsOf(value.decVal);
    const Int128 integer = IntegerOf(value);
    return DigitsOf(integer < 0, static_cast<UInt128>(integer < 0 ? -integer : integer), 0);
}

template <typename T>
HRESULT Order(T left, T right) {
    return left < right ? VARCMP_LT : left == right ? VARCMP_EQ : VARCMP_GT;
}

// NORM_IGNORECASE folds A-Z and the Latin-1 capitals to lower case.
OLECHAR Fold(OLECHAR c) {
    if ((c >= 'A' && c <= 'Z') || (c >= 0xC0 && c <= 0xDE && c != 0xD7))
        return static_cast<OLECHAR>(c + 0x20);
    return c;
}

HRESULT CompareText(BSTR left, BSTR right, ULONG flags) {
    const UINT leftLength = SysStringLen(left), rightLength = SysStringLen(right);
    const UINT common = leftLength < rightLength ? leftLength : rightLength;
    for (UINT i = 0; i < common; ++i) {
        OLECHAR a = left[i], b = right[i];
        if (flags & NORM_IGNORECASE) {
            a = Fold(a);
            b = Fold(b);
        }
        if (a != b)
            return a < b ? VARCMP_LT : VARCMP_GT;
    }
    return Order(leftLength, rightLength);
}

} // namespace

extern "C" {

HRESULT WINAPI VarCmp(LPVARIANT left, LPVARIANT right, LCID lcid, ULONG flags) {
    if (!left || !right)
        return E_INVALIDARG;
    VARIANT a, b;
    HRESULT hr = Read(*left, &a);
    if (SUCCEEDED(hr))
        hr = Read(*right, &b);
    if (FAILED(hr))
        return hr;
    const Class x = ClassOf(a.vt), y = ClassOf(b.vt);
    if (x == Class::kBad || y == Class::kBad)
        return DISP_E_BADVARTYPE;
    if (x == Class::kUncomparable || y == Class::kUncomparable)
        return DISP_E_TYPEMISMATCH;
    if (x == Class::kError || y == Class::kError) {
        if (x != y)
            return DISP_E_TYPEMISMATCH;
        return Order(a.scode, b.scode);
    }
    if (x == Class::kNull || y == Class::kNull)
        return VARCMP_NULL;
    if (x == Class::kText || y == Class::kText) {
        // VT_EMPTY is the empty text; any number is less than any text.
        const bool leftText = x == Class::kText || a.vt == VT_EMPTY;
        const bool rightText = y == Class::kText || b.vt == VT_EMPTY;
        if (leftText && rightText) {
            if (!IsKnownLocale(lcid))
                return E_INVALIDARG;
            return CompareText(a.vt == VT_BSTR ? a.bstrVal : nullptr,
                               b.vt == VT_BSTR ? b.bstrVal : nullptr, flags);
        }
        return leftText ? VARCMP_GT : VARCMP_LT;
    }
    if (x == Class::kInteger && y == Class::kInteger)
        return Order(IntegerOf(a), IntegerOf(b));
    if ((x == Class::kFloat && (y == Class::kReal || y == Class::kFloat)) ||
        (y == Class::kFloat && x == Class::kReal))
        return Order(static_cast<float>(RealOf(a, x)), static_cast<float>(RealOf(b, y)));
    if (x == Class::kReal || x == Class::kFloat || y == Class::kReal || y == Class::kFloat)
        return Order(RealOf(a, x), RealOf(b, y));
    const int order = CompareDigits(ExactOf(a), ExactOf(b));
    return order < 0 ? VARCMP_LT : order == 0 ? VARCMP_EQ : VARCMP_GT;
}

} // extern "C"
