// An object with IUnknown and IPersist that counts its references and never
// frees itself, so that tests can check the counts that marshalling and
// monikers leave; references may move on several threads.
#pragma once

#include <vaskel/win32.h>

#include <atomic>

namespace vaskel_test {

class PersistObject : public IPersist {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID riid, void** object) override {
        if (riid == IID_IUnknown || riid == IID_IPersist) {
            AddRef();
            *object = static_cast<IPersist*>(this);
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }
    HRESULT STDMETHODCALLTYPE GetClassID(CLSID* clsid) override {
        *clsid = CLSID_NULL;
        return S_OK;
    }

    std::atomic<ULONG> references{1};
};

} // namespace vaskel_test
