// The process's table of registered class objects, and creating instances
// through them.
#include "apartment.h"

#include <vkwin32/objbase.h>

#include <cstring>
#include <mutex>
#include <new>
#include <vector>

namespace {

struct Registration {
    CLSID clsid;
    IUnknown* object;
    DWORD contexts; // the server kinds the registration serves
    DWORD cookie;
    bool singleUse;
    bool connected = false; // a single-use object, once connected, is hidden
};

struct ClassTable {
    std::mutex lock;
    std::vector<Registration> entries;
    DWORD lastCookie = 0;
};

ClassTable& Table() {
    // Never destroyed: registrations may outlive static destruction order.
    static ClassTable* table = new ClassTable;
    return *table;
}

bool SameClass(const CLSID& a, const CLSID& b) {
    return std::memcmp(&a, &b, sizeof(CLSID)) == 0;
}

// Takes a reference to the first registration of the class that serves the
// kind of server asked for; null when none does.
IUnknown* FindServing(ClassTable& table, REFCLSID clsid, DWORD kind) {
    for (Registration& entry : table.entries) {
        if (!SameClass(entry.clsid, clsid) || (entry.contexts & kind) == 0)
            continue;
        if (entry.singleUse && entry.connected)
            continue;
        entry.connected = true;
        // Under the lock, so that a revocation cannot release the object
        // between finding it and holding it. AddRef must not re-enter COM.
        entry.object->AddRef();
        return entry.object;
    }
    return nullptr;
}

} // namespace

extern "C" HRESULT WINAPI CoRegisterClassObject(REFCLSID clsid, LPUNKNOWN object, DWORD clsContext,
                                                DWORD flags, LPDWORD cookie) {
    if (cookie == nullptr || object == nullptr)
        return E_INVALIDARG;
    *cookie = 0;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    if ((flags & REGCLS_SUSPENDED) != 0)
        return E_INVALIDARG;
    DWORD contexts = clsContext & (CLSCTX_INPROC_SERVER | CLSCTX_LOCAL_SERVER);
    if (contexts == 0)
        return E_INVALIDARG;
    DWORD use = flags & (REGCLS_MULTIPLEUSE | REGCLS_MULTI_SEPARATE);
    bool singleUse = use == REGCLS_SINGLEUSE;
    // A single-use object serves one client process; in-process use of it is
    // an error.
    if (singleUse && (contexts & CLSCTX_INPROC_SERVER) != 0)
        return E_INVALIDARG;
    if (use == REGCLS_MULTIPLEUSE && (contexts & CLSCTX_LOCAL_SERVER) != 0)
        contexts |= CLSCTX_INPROC_SERVER;

    ClassTable& table = Table();
    std::lock_guard<std::mutex> hold(table.lock);
    try {
        table.entries.reserve(table.entries.size() + 1);
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    }
    // Zero means "no registration"; a wrapped counter skips it and cookies
    // still in use.
    DWORD next = table.lastCookie;
    for (;;) {
        ++next;
        if (next == 0)
            continue;
        bool inUse = false;
        for (const Registration& entry : table.entries)
            inUse = inUse || entry.cookie == next;
        if (!inUse)
            break;
    }
    table.lastCookie = next;
    object->AddRef();
    table.entries.push_back(Registration{clsid, object, contexts, next, singleUse});
    *cookie = next;
    return S_OK;
}

extern "C" HRESULT WINAPI CoRevokeClassObject(DWORD cookie) {
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    IUnknown* object = nullptr;
    {
        ClassTable& table = Table();
        std::lock_guard<std::mutex> hold(table.lock);
        for (auto entry = table.entries.begin(); entry != table.entries.end(); ++entry) {
            if (entry->cookie == cookie && cookie != 0) {
                object = entry->object;
                table.entries.erase(entry);
                break;
            }
        }
    }
    if (object == nullptr)
        return CO_E_OBJNOTREG;
    // Outside the lock: the object's last release may call back into COM.
    object->Release();
    return S_OK;
}

extern "C" HRESULT WINAPI CoGetClassObject(REFCLSID clsid, DWORD clsContext, LPVOID /*serverInfo*/,
                                           REFIID riid, LPVOID* object) {
    if (object == nullptr)
        return E_INVALIDARG;
    *object = nullptr;
    if (!vkw32::InApartment())
        return CO_E_NOTINITIALIZED;
    IUnknown* found = nullptr;
    {
        ClassTable& table = Table();
        std::lock_guard<std::mutex> hold(table.lock);
        // An in-process server is preferred to a local one, as on Windows.
        if ((clsContext & CLSCTX_INPROC_SERVER) != 0)
            found = FindServing(table, clsid, CLSCTX_INPROC_SERVER);
        if (found == nullptr && (clsContext & CLSCTX_LOCAL_SERVER) != 0)
            found = FindServing(table, clsid, CLSCTX_LOCAL_SERVER);
    }
    if (found == nullptr)
        return REGDB_E_CLASSNOTREG;
    HRESULT hr = found->QueryInterface(riid, object);
    if (FAILED(hr))
        *object = nullptr;
    found->Release();
    return hr;
}

extern "C" HRESULT WINAPI CoCreateInstance(REFCLSID clsid, LPUNKNOWN outer, DWORD clsContext,
                                           REFIID riid, LPVOID* object) {
    if (object == nullptr)
        return E_POINTER;
    *object = nullptr;
    void* factory = nullptr;
    HRESULT hr = CoGetClassObject(clsid, clsContext, nullptr, IID_IClassFactory, &factory);
    if (FAILED(hr))
        return hr;
    auto classFactory = static_cast<IClassFactory*>(factory);
    hr = classFactory->CreateInstance(outer, riid, object);
    classFactory->Release();
    if (FAILED(hr))
        *object = nullptr;
    return hr;
}
