#include <vkwin32/oleauto.h>

namespace {

const VARTYPE kFlags = VT_ARRAY | VT_BYREF;

bool IsValueType(VARTYPE base) {
    switch (base) {
    case VT_EMPTY:
    case VT_NULL:
    case VT_I2:
    case VT_I4:
    case VT_R4:
    case VT_R8:
    case VT_CY:
    case VT_DATE:
    case VT_BSTR:
    case VT_DISPATCH:
    case VT_ERROR:
    case VT_BOOL:
    case VT_UNKNOWN:
    case VT_DECIMAL:
    case VT_I1:
    case VT_UI1:
    case VT_UI2:
    case VT_UI4:
    case VT_I8:
    case VT_UI8:
    case VT_INT:
    case VT_UINT:
        return true;
    default:
        return false;
    }
}

// Whether a variant may hold this type code. A bare VT_VARIANT holds nothing,
// as the system has it; a record is held only by reference, as no record can
// be copied here.
bool IsVariantType(VARTYPE vt) {
    if (vt & ~(VT_TYPEMASK | kFlags))
        return false;
    const VARTYPE base = vt & VT_TYPEMASK;
    if (base == VT_VARIANT)
        return true;
    if (vt & VT_BYREF)
        return (IsValueType(base) && base != VT_EMPTY && base != VT_NULL) ||
               (base == VT_RECORD && !(vt & VT_ARRAY));
    return IsValueType(base);
}

// Every interface's first three slots are IUnknown's, so a dispatch pointer
// is reference counted through the unknown member that overlays it.
IUnknown* Interface(const VARIANT& value) {
    return value.punkVal;
}

// Replaces the owned content of a bitwise copy with a duplicate of its own.
HRESULT DuplicateOwned(VARIANT& value) {
    if (value.vt & VT_BYREF)
        return S_OK;
    if (value.vt & VT_ARRAY)
        return SafeArrayCopy(value.parray, &value.parray);
    switch (value.vt) {
    case VT_BSTR:
        if (value.bstrVal) {
            value.bstrVal = SysAllocStringByteLen(reinterpret_cast<LPCSTR>(value.bstrVal),
                                                  SysStringByteLen(value.bstrVal));
            if (!value.bstrVal)
                return E_OUTOFMEMORY;
        }
        return S_OK;
    case VT_UNKNOWN:
    case VT_DISPATCH:
        if (Interface(value))
            Interface(value)->AddRef();
        return S_OK;
    default:
        return S_OK;
    }
}

// The value a by-reference variant points at, as a bitwise variant of the
// referenced type; a reference to a variant that is itself a reference to a
// variant is refused, as the system does.
HRESULT Dereference(const VARIANT& source, VARIANT& value) {
    if (!source.byref)
        return E_INVALIDARG;
    const VARTYPE type = source.vt & ~VT_BYREF;
    value = VARIANT{};
    if (type & VT_ARRAY) {
        value.parray = *source.pparray;
    } else {
        switch (type) {
        case VT_VARIANT:
            if (!IsVariantType(source.pvarVal->vt))
                return DISP_E_BADVARTYPE;
            if (source.pvarVal->vt == (VT_VARIANT | VT_BYREF))
                return E_INVALIDARG;
            if (source.pvarVal->vt & VT_BYREF)
                return Dereference(*source.pvarVal, value);
            value = *source.pvarVal;
            return S_OK;
        case VT_DECIMAL:
            value.decVal = *source.pdecVal;
            break;
        case VT_I1:
        case VT_UI1:
            value.bVal = *source.pbVal;
            break;
        case VT_I2:
        case VT_UI2:
        case VT_BOOL:
            value.iVal = *source.piVal;
            break;
        case VT_I4:
        case VT_UI4:
        case VT_R4:
        case VT_ERROR:
        case VT_INT:
        case VT_UINT:
            value.lVal = *source.plVal;
            break;
        case VT_BSTR:
            value.bstrVal = *source.pbstrVal;
            break;
        case VT_UNKNOWN:
        case VT_DISPATCH:
            value.punkVal = *source.ppunkVal;
            break;
        case VT_RECORD:
            return DISP_E_BADVARTYPE;
        default: // the remaining value types are eight bytes wide
            value.llVal = *source.pllVal;
            break;
        }
    }
    value.vt = type;
    return S_OK;
}

// Moves a finished copy into the destination, clearing what was there.
HRESULT Replace(VARIANTARG* destination, VARIANT& copy) {
    const HRESULT hr = VariantClear(destination);
    if (FAILED(hr)) {
        VariantClear(&copy);
        return hr;
    }
    *destination = copy;
    return S_OK;
}

} // namespace

extern "C" {

void WINAPI VariantInit(VARIANTARG* variant) {
    if (variant)
        variant->vt = VT_EMPTY;
}

HRESULT WINAPI VariantClear(VARIANTARG* variant) {
    if (!variant)
        return E_INVALIDARG;
    if (!IsVariantType(variant->vt))
        return DISP_E_BADVARTYPE;
    if (variant->vt & VT_ARRAY && !(variant->vt & VT_BYREF)) {
        const HRESULT hr = SafeArrayDestroy(variant->parray);
        if (FAILED(hr))
            return hr;
    } else if (variant->vt == VT_BSTR) {
        SysFreeString(variant->bstrVal);
    } else if ((variant->vt == VT_UNKNOWN || variant->vt == VT_DISPATCH) && Interface(*variant)) {
        Interface(*variant)->Release();
    }
    variant->vt = VT_EMPTY;
    return S_OK;
}

HRESULT WINAPI VariantCopy(VARIANTARG* destination, const VARIANTARG* source) {
    if (!destination || !source)
        return E_INVALIDARG;
    if (!IsVariantType(source->vt))
        return DISP_E_BADVARTYPE;
    if (destination == source)
        return S_OK;
    VARIANT copy = *source;
    const HRESULT hr = DuplicateOwned(copy);
    if (FAILED(hr))
        return hr;
    return Replace(destination, copy);
}

HRESULT WINAPI VariantCopyInd(VARIANT* destination, const VARIANTARG* source) {
    if (!destination || !source)
        return E_INVALIDARG;
    if (!IsVariantType(source->vt))
        return DISP_E_BADVARTYPE;
    if (!(source->vt & VT_BYREF))
        return VariantCopy(destination, source);
    VARIANT copy;
    HRESULT hr = Dereference(*source, copy);
    if (SUCCEEDED(hr))
        hr = DuplicateOwned(copy);
    if (FAILED(hr))
        return hr;
    return Replace(destination, copy);
}

} // extern "C"
