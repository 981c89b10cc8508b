// The interface every COM object implements: identity and reference counting.
#pragma once

#include "types.h"

struct IUnknown {
    virtual HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) = 0;
    virtual ULONG STDMETHODCALLTYPE AddRef() = 0;
    virtual ULONG STDMETHODCALLTYPE Release() = 0;
};
typedef IUnknown* LPUNKNOWN;

extern "C" const IID IID_IUnknown;

// The class object that makes instances of a class. CreateInstance with an
// outer unknown asks for an aggregated instance, which a class may refuse with
// CLASS_E_NOAGGREGATION; LockServer keeps the server loaded.
struct IClassFactory : IUnknown {
    virtual HRESULT STDMETHODCALLTYPE CreateInstance(IUnknown* outer, REFIID riid,
                                                     void** object) = 0;
    virtual HRESULT STDMETHODCALLTYPE LockServer(BOOL lock) = 0;
};
typedef IClassFactory* LPCLASSFACTORY;

extern "C" const IID IID_IClassFactory;
