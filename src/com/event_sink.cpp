#include <vaskel/event_sink.h>

namespace vaskel {

IMPLEMENT_DYNCREATE(CKXEventSink, CCmdTarget)

CKXEventSink::CKXEventSink() {
    EnableAutomation();
}

CKXEventSink::~CKXEventSink() {
    source.Release();
}

void CKXEventSink::OnFinalRelease() {
    CCmdTarget::OnFinalRelease();
}

void CKXEventSink::SetUUID(GUID iid) {
    eventIid = iid;
    SetDispatchIID(iid);
}

int CKXEventSink::ConnectSink(CInterfacePtr<IUnknown> newSource) {
    if (source)
        Disconnect();
    if (newSource != source)
        source = newSource;
    const int result = Connect();
    if (!result)
        source.Release();
    return result;
}

int CKXEventSink::DisconnectSink() {
    if (!source)
        return 1;
    return Disconnect();
}

IUnknown* CKXEventSink::SinkIdentity() {
    IDispatch* dispatch = GetIDispatch(FALSE);
    if (!dispatch)
        return nullptr;
    IUnknown* identity = nullptr;
    const HRESULT hr = dispatch->QueryInterface(IID_IUnknown, reinterpret_cast<void**>(&identity));
    if (hr == E_NOINTERFACE)
        return nullptr;
    if (FAILED(hr))
        throw _com_error(hr);
    return identity;
}

int CKXEventSink::Connect() {
    if (!source)
        return 0;
    // The source stays alive for the whole advise even if a callback drops it.
    CInterfacePtr<IUnknown> held(source);
    IUnknown* identity = SinkIdentity();
    DWORD newCookie = 0;
    const BOOL advised = AfxConnectionAdvise(held.get(), eventIid, identity, FALSE, &newCookie);
    if (identity)
        identity->Release();
    if (advised)
        cookie = newCookie;
    return advised ? 1 : 0;
}

int CKXEventSink::Disconnect() {
    IUnknown* identity = SinkIdentity();
    const BOOL unadvised =
        source ? AfxConnectionUnadvise(source.get(), eventIid, identity, FALSE, cookie) : FALSE;
    if (identity)
        identity->Release();
    source.Release();
    cookie = 0;
    return unadvised ? 1 : 0;
}

} // namespace vaskel
