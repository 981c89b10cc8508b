// Running an object: only objects that can be loaded without running (those
// with IRunnableObject) have anything to do.
#include <vkwin32/ole2.h>
#include <vkwin32/winerror.h>

extern "C" HRESULT WINAPI OleRun(LPUNKNOWN object) {
    if (!object)
        return E_INVALIDARG;
    IRunnableObject* runnable = nullptr;
    if (FAILED(object->QueryInterface(IID_IRunnableObject, reinterpret_cast<void**>(&runnable))) ||
        !runnable)
        return S_OK;
    const HRESULT hr = runnable->Run(nullptr);
    runnable->Release();
    return hr;
}
