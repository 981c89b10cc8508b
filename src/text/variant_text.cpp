#include <vaskel/text.h>

#include <algorithm>

namespace vaskel {

CString& AsString(CString& out, const VARIANT& value) {
    out = value.vt == VT_BSTR && value.bstrVal ? CString(value.bstrVal) : CString();
    return out;
}

CString AsString(const VARIANT& value) {
    CString out;
    return AsString(out, value);
}

bool AsULong(const VARIANT& value, DWORD& out) {
    if (value.vt == VT_UI4) {
        out = value.ulVal;
        return true;
    }
    VARIANT converted;
    VariantInit(&converted);
    if (FAILED(VariantChangeType(&converted, const_cast<VARIANT*>(&value), 0, VT_UI4)))
        return false;
    out = converted.ulVal;
    return true;
}

int VKCompareBSTR(BSTR left, BSTR right) {
    const UINT leftLength = SysStringLen(left);
    const UINT rightLength = SysStringLen(right);
    const UINT common = std::min(leftLength, rightLength);
    for (UINT i = 0; i < common; ++i) {
        const auto a = static_cast<unsigned short>(left[i]);
        const auto b = static_cast<unsigned short>(right[i]);
        if (a != b)
            return a < b ? -1 : 1;
    }
    return leftLength < rightLength ? -1 : leftLength > rightLength ? 1 : 0;
}

} // namespace vaskel
