#include "text/wide_string.h"

#include <vaskel/interface_ptr.h>
#include <vaskel/object_ref.h>

namespace vaskel {

HRESULT COMObjRef::MakeDisplayName(IUnknown* object, CString& name) {
    CInterfacePtr<IBindCtx> context;
    HRESULT hr = CreateBindCtx(0, context.GetAddress());
    if (FAILED(hr))
        return hr;
    CInterfacePtr<IMoniker> moniker;
    hr = CreateObjrefMoniker(object, moniker.GetAddress());
    if (FAILED(hr))
        return hr;
    if (!moniker.get())
        return E_POINTER;
    LPOLESTR displayName = nullptr;
    hr = moniker->GetDisplayName(context.get(), nullptr, &displayName);
    if (FAILED(hr))
        return hr;
    // The name is the platform's memory whatever happens to the copy.
    try {
        name = displayName ? CString(displayName) : CString();
    } catch (...) {
        hr = E_OUTOFMEMORY;
    }
    CoTaskMemFree(displayName);
    return FAILED(hr) ? hr : S_OK;
}

HRESULT COMObjRef::ParseDisplayName(const char* name, const GUID& iid, IUnknown** object) {
    if (!object)
        return E_POINTER;
    CInterfacePtr<IBindCtx> context;
    HRESULT hr = CreateBindCtx(0, context.GetAddress());
    if (FAILED(hr))
        return hr;
    const WideString wideName(name, CP_THREAD_ACP);
    if (FAILED(wideName.Status()))
        return wideName.Status();
    ULONG eaten = 0;
    CInterfacePtr<IMoniker> moniker;
    hr = MkParseDisplayName(context.get(), wideName.get(), &eaten, moniker.GetAddress());
    if (FAILED(hr))
        return hr;
    if (!moniker.get())
        return E_POINTER;
    // Bound into a local first: *object is written only on success.
    IUnknown* bound = nullptr;
    hr = moniker->BindToObject(context.get(), nullptr, iid, reinterpret_cast<void**>(&bound));
    if (SUCCEEDED(hr))
        *object = bound;
    else if (bound)
        bound->Release();
    return hr;
}

} // namespace vaskel
