#include <vkwin32/oleauto.h>

extern "C" {

HRESULT WINAPI VarBstrFromDate(DATE, LCID, ULONG, BSTR* result) {
    if (result)
        *result = nullptr;
    return E_NOTIMPL;
}

HRESULT WINAPI VarDateFromStr(LPCOLESTR, LCID, ULONG, DATE*) {
    return E_NOTIMPL;
}

} // extern "C"
