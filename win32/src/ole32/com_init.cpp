// A thread's COM apartment: entered by the first initialisation, counted by
// the following ones, left when the count returns to zero.
#include "apartment.h"

#include <vkwin32/objbase.h>

namespace {

struct Apartment {
    unsigned count = 0;
    bool multithreaded = false;
};

thread_local Apartment apartment;

} // namespace

bool vkw32::InApartment() {
    return apartment.count > 0;
}

extern "C" HRESULT WINAPI CoInitializeEx(LPVOID /*reserved*/, DWORD coInit) {
    bool multithreaded = (coInit & COINIT_APARTMENTTHREADED) == 0;
    if (apartment.count > 0) {
        if (apartment.multithreaded != multithreaded)
            return RPC_E_CHANGED_MODE;
        ++apartment.count;
        return S_FALSE;
    }
    apartment.count = 1;
    apartment.multithreaded = multithreaded;
    return S_OK;
}

extern "C" HRESULT WINAPI CoInitialize(LPVOID reserved) {
    return CoInitializeEx(reserved, COINIT_APARTMENTTHREADED);
}

extern "C" void WINAPI CoUninitialize(void) {
    if (apartment.count > 0)
        --apartment.count;
}
