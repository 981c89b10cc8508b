#include <vaskel/framework/cmd_target.h>

namespace vaskel {
namespace {

// The connection point of the source for iid, or null.
IConnectionPoint* FindPoint(LPUNKNOWN source, REFIID iid) {
    IConnectionPointContainer* container = nullptr;
    if (FAILED(source->QueryInterface(IID_IConnectionPointContainer,
                                      reinterpret_cast<void**>(&container))) ||
        !container)
        return nullptr;
    IConnectionPoint* point = nullptr;
    if (FAILED(container->FindConnectionPoint(iid, &point)))
        point = nullptr;
    container->Release();
    return point;
}

} // namespace

BOOL AfxConnectionAdvise(LPUNKNOWN source, REFIID iid, LPUNKNOWN sink, BOOL refCount,
                         DWORD* cookie) {
    if (!source || !sink || !cookie)
        return FALSE;
    IConnectionPoint* point = FindPoint(source, iid);
    if (!point)
        return FALSE;
    DWORD newCookie = 0;
    const bool advised = SUCCEEDED(point->Advise(sink, &newCookie));
    point->Release();
    if (!advised)
        return FALSE;
    *cookie = newCookie;
    // The point holds the sink now; give that reference back so that the
    // connection does not keep the sink alive.
    if (!refCount)
        sink->Release();
    return TRUE;
}

BOOL AfxConnectionUnadvise(LPUNKNOWN source, REFIID iid, LPUNKNOWN sink, BOOL refCount,
                           DWORD cookie) {
    if (!source || !sink)
        return FALSE;
    IConnectionPoint* point = FindPoint(source, iid);
    if (!point)
        return FALSE;
    // The reference given back at advise time is restored for the point to
    // release.
    if (!refCount)
        sink->AddRef();
    const bool unadvised = SUCCEEDED(point->Unadvise(cookie));
    point->Release();
    if (!unadvised && !refCount)
        sink->Release();
    return unadvised ? TRUE : FALSE;
}

} // namespace vaskel
