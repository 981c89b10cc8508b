// CKXEventSink: an automation command target that connects itself to a
// source object's connection point for one event (outgoing) interface.
// Derived classes receive the events through the command target's dispatch
// hooks and name the event interface with SetUUID.
//
// The connection holds no reference on the sink (the advise's reference is
// given back), so the connection alone never keeps a sink alive; a sink must
// be disconnected before it goes. The sink holds a reference on its source
// while connected.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/cmd_target.h>
#include <vaskel/interface_ptr.h>
#include <vaskel/win32.h>

namespace vaskel {

class VASKEL_API CKXEventSink : public CCmdTarget {
    DECLARE_DYNCREATE(CKXEventSink)

public:
    // Automation is enabled; nothing is connected.
    CKXEventSink();
    ~CKXEventSink() override;
    // The command target's default: the sink deletes itself when its last
    // automation reference goes.
    void OnFinalRelease() override;

    // Disconnects from any current source, then advises the new one's
    // connection point for the event interface. Non-zero on success; on
    // failure (no such connection point, a null source) nothing is
    // connected and no source is kept.
    int ConnectSink(CInterfacePtr<IUnknown> newSource);
    // Non-zero on success, and when nothing was connected.
    int DisconnectSink();

protected:
    // The advise and unadvise with the source that is set; 0 without one.
    // The sink's identity query failing otherwise than with E_NOINTERFACE
    // throws _com_error.
    virtual int Connect();
    virtual int Disconnect();

    // Names the event interface; the sink's IDispatch answers to it too, as
    // connection points query their sinks for the event interface.
    void SetUUID(GUID iid);

    CInterfacePtr<IUnknown> source;
    GUID eventIid = {};
    DWORD cookie = 0;

private:
    // The sink's IUnknown with a reference, or null.
    IUnknown* SinkIdentity();
};

} // namespace vaskel
