// An object that counts its references and never deletes itself, so that
// tests can check that copies and clears keep the count balanced.
#pragma once

#include <vaskel/win32.h>

namespace vaskel_test {

class CountingUnknown : public IUnknown {
public:
    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID, void** object) override {
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }

    ULONG references = 1;
};

} // namespace vaskel_test
