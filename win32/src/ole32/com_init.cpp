// A thread's COM apartment: entered by the first initialisation, counted by
// the following ones, left when the count returns to zero. A thread is alone
// in its single-threaded apartment or shares the process's one multithreaded
// apartment, which ends when its last thread leaves. Leaving an apartment
// disconnects what was marshalled from it. CoUninitialize on a thread outside
// an apartment does nothing.
#include "apartment.h"

#include <vkwin32/objbase.h>

#include <atomic>
#include <mutex>

namespace {

struct Apartment {
    unsigned count = 0;
    bool multithreaded = false;
    std::uint64_t id = 0;
};

thread_local Apartment apartment;

std::atomic<std::uint64_t> lastApartmentId{0};

std::uint64_t NewApartmentId() {
    return lastApartmentId.fetch_add(1, std::memory_order_relaxed) + 1;
}

// The process's multithreaded apartment: its threads and its identifier.
struct Multithreaded {
    std::mutex lock;
    unsigned threads = 0;
    std::uint64_t id = 0;
};

Multithreaded& Mta() {
    static Multithreaded* mta = new Multithreaded; // threads may outlive static destructors
    return *mta;
}

} // namespace

bool vkw32::InApartment() {
    return apartment.count > 0;
}

std::uint64_t vkw32::CurrentApartment() {
    return apartment.count > 0 ? apartment.id : 0;
}

extern "C" HRESULT WINAPI CoInitializeEx(LPVOID /*reserved*/, DWORD coInit) {
    bool multithreaded = (coInit & COINIT_APARTMENTTHREADED) == 0;
    if (apartment.count > 0) {
        if (apartment.multithreaded != multithreaded)
            return RPC_E_CHANGED_MODE;
        ++apartment.count;
        return S_FALSE;
    }
    std::uint64_t id;
    if (multithreaded) {
        Multithreaded& mta = Mta();
        std::lock_guard<std::mutex> hold(mta.lock);
        if (mta.threads++ == 0)
            mta.id = NewApartmentId();
        id = mta.id;
    } else {
        id = NewApartmentId();
    }
    apartment.count = 1;
    apartment.multithreaded = multithreaded;
    apartment.id = id;
    return S_OK;
}

extern "C" HRESULT WINAPI CoInitialize(LPVOID reserved) {
    return CoInitializeEx(reserved, COINIT_APARTMENTTHREADED);
}

extern "C" void WINAPI CoUninitialize(void) {
    if (apartment.count == 0 || --apartment.count > 0)
        return;
    std::uint64_t ended = apartment.id;
    apartment.id = 0;
    if (apartment.multithreaded) {
        Multithreaded& mta = Mta();
        std::lock_guard<std::mutex> hold(mta.lock);
        if (--mta.threads > 0)
            ended = 0; // other threads are still in it
    }
    // Outside every lock: disconnecting releases objects, which may call COM.
    if (ended != 0)
        vkw32::DisconnectApartment(ended);
}
