// Connection points: how an object hands its outgoing (event) interface to
// sinks. A container finds the connection point for an event interface; the
// point keeps each advised sink, with a reference, under a non-zero cookie
// until the sink is unadvised with that cookie.
#pragma once

#include "oaidl.h"
#include "types.h"
#include "unknwn.h"
#include "winerror.h"

struct IConnectionPoint;
struct IConnectionPointContainer;

typedef struct tagCONNECTDATA {
    IUnknown* pUnk;
    DWORD dwCookie;
} CONNECTDATA, *PCONNECTDATA, *LPCONNECTDATA;

struct IEnumConnections : IUnknown {
    virtual HRESULT STDMETHODCALLTYPE Next(ULONG count, LPCONNECTDATA connections,
                                           ULONG* fetched) = 0;
    virtual HRESULT STDMETHODCALLTYPE Skip(ULONG count) = 0;
    virtual HRESULT STDMETHODCALLTYPE Reset() = 0;
    virtual HRESULT STDMETHODCALLTYPE Clone(IEnumConnections** copy) = 0;
};
typedef IEnumConnections *PENUMCONNECTIONS, *LPENUMCONNECTIONS;

// Advise queries the sink for the event interface and fails with
// CONNECT_E_CANNOTCONNECT when it does not answer; Unadvise with a cookie
// that names no connection fails with CONNECT_E_NOCONNECTION.
struct IConnectionPoint : IUnknown {
    virtual HRESULT STDMETHODCALLTYPE GetConnectionInterface(IID* iid) = 0;
    virtual HRESULT STDMETHODCALLTYPE
    GetConnectionPointContainer(IConnectionPointContainer** container) = 0;
    virtual HRESULT STDMETHODCALLTYPE Advise(IUnknown* sink, DWORD* cookie) = 0;
    virtual HRESULT STDMETHODCALLTYPE Unadvise(DWORD cookie) = 0;
    virtual HRESULT STDMETHODCALLTYPE EnumConnections(IEnumConnections** connections) = 0;
};
typedef IConnectionPoint *PCONNECTIONPOINT, *LPCONNECTIONPOINT;

struct IEnumConnectionPoints : IUnknown {
    virtual HRESULT STDMETHODCALLTYPE Next(ULONG count, LPCONNECTIONPOINT* points,
                                           ULONG* fetched) = 0;
    virtual HRESULT STDMETHODCALLTYPE Skip(ULONG count) = 0;
    virtual HRESULT STDMETHODCALLTYPE Reset() = 0;
    virtual HRESULT STDMETHODCALLTYPE Clone(IEnumConnectionPoints** copy) = 0;
};
typedef IEnumConnectionPoints *PENUMCONNECTIONPOINTS, *LPENUMCONNECTIONPOINTS;

// FindConnectionPoint for an interface the object does not source fails
// with CONNECT_E_NOCONNECTION and a null point.
struct IConnectionPointContainer : IUnknown {
    virtual HRESULT STDMETHODCALLTYPE EnumConnectionPoints(IEnumConnectionPoints** points) = 0;
    virtual HRESULT STDMETHODCALLTYPE FindConnectionPoint(REFIID iid, IConnectionPoint** point) = 0;
};
typedef IConnectionPointContainer *PCONNECTIONPOINTCONTAINER, *LPCONNECTIONPOINTCONTAINER;

#define CONNECT_E_FIRST VKW32_HR(0x80040200)
#define CONNECT_E_LAST VKW32_HR(0x8004020F)
#define CONNECT_E_NOCONNECTION VKW32_HR(0x80040200)
#define CONNECT_E_ADVISELIMIT VKW32_HR(0x80040201)
#define CONNECT_E_CANNOTCONNECT VKW32_HR(0x80040202)
#define CONNECT_E_OVERRIDDEN VKW32_HR(0x80040203)

extern "C" const IID IID_IConnectionPointContainer;
extern "C" const IID IID_IConnectionPoint;
extern "C" const IID IID_IEnumConnections;
extern "C" const IID IID_IEnumConnectionPoints;
