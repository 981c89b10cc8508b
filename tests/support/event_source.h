// An event source for tests: an object with one connection point for an
// event interface, which keeps the advised sinks as IDispatch pointers (with
// a reference each) and fires an event to all of them through Invoke. Its
// own reference count is kept for inspection; it never deletes itself, so
// tests keep it on the stack.
#pragma once

#include <vaskel/win32.h>

#include <utility>
#include <vector>

namespace vaskel_test {

class EventSource : public IConnectionPointContainer {
public:
    explicit EventSource(const IID& eventIid) : m_point(this, eventIid) {}
    EventSource(const EventSource&) = delete;
    EventSource& operator=(const EventSource&) = delete;
    virtual ~EventSource() { m_point.UnadviseAll(); }

    HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
        if (!object)
            return E_POINTER;
        if (iid == IID_IUnknown || iid == IID_IConnectionPointContainer) {
            *object = static_cast<IConnectionPointContainer*>(this);
            AddRef();
            return S_OK;
        }
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
    ULONG STDMETHODCALLTYPE Release() override { return --references; }

    HRESULT STDMETHODCALLTYPE EnumConnectionPoints(IEnumConnectionPoints** points) override {
        if (points)
            *points = nullptr;
        return E_NOTIMPL;
    }
    HRESULT STDMETHODCALLTYPE FindConnectionPoint(REFIID iid, IConnectionPoint** point) override {
        if (!point)
            return E_POINTER;
        if (iid != m_point.eventIid) {
            *point = nullptr;
            return CONNECT_E_NOCONNECTION;
        }
        m_point.AddRef();
        *point = &m_point;
        return S_OK;
    }

    // Calls every advised sink's Invoke as a method with the arguments (in
    // the order DISPPARAMS holds them: last argument first); the results of
    // the calls, one per sink.
    std::vector<HRESULT> Fire(DISPID id, std::vector<VARIANT> arguments = {}) {
        DISPPARAMS params = {arguments.empty() ? nullptr : arguments.data(), nullptr,
                             static_cast<UINT>(arguments.size()), 0};
        std::vector<HRESULT> results;
        // A copy: a sink may disconnect from within its handler.
        std::vector<Connection> sinks = m_point.connections;
        for (Connection& c : sinks)
            c.sink->AddRef();
        for (Connection& c : sinks) {
            results.push_back(c.sink->Invoke(id, IID_NULL, 0, DISPATCH_METHOD, &params, nullptr,
                                             nullptr, nullptr));
            c.sink->Release();
        }
        return results;
    }
    size_t ConnectionCount() const { return m_point.connections.size(); }
    ULONG PointReferences() const { return m_point.references; }

    ULONG references = 1;

private:
    struct Connection {
        IDispatch* sink;
        DWORD cookie;
    };

    class Point : public IConnectionPoint {
    public:
        Point(EventSource* owner, const IID& iid) : eventIid(iid), m_owner(owner) {}

        HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
            if (!object)
                return E_POINTER;
            if (iid == IID_IUnknown || iid == IID_IConnectionPoint) {
                *object = static_cast<IConnectionPoint*>(this);
                AddRef();
                return S_OK;
            }
            *object = nullptr;
            return E_NOINTERFACE;
        }
        ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
        ULONG STDMETHODCALLTYPE Release() override { return --references; }

        HRESULT STDMETHODCALLTYPE GetConnectionInterface(IID* iid) override {
            if (!iid)
                return E_POINTER;
            *iid = eventIid;
            return S_OK;
        }
        HRESULT STDMETHODCALLTYPE
        GetConnectionPointContainer(IConnectionPointContainer** container) override {
            if (!container)
                return E_POINTER;
            m_owner->AddRef();
            *container = m_owner;
            return S_OK;
        }
        // The sink must answer the event interface, as the system's
        // connection points require.
        HRESULT STDMETHODCALLTYPE Advise(IUnknown* sink, DWORD* cookie) override {
            if (!sink || !cookie)
                return E_POINTER;
            IDispatch* events = nullptr;
            if (FAILED(sink->QueryInterface(eventIid, reinterpret_cast<void**>(&events))))
                return CONNECT_E_CANNOTCONNECT;
            *cookie = ++m_lastCookie;
            connections.push_back({events, *cookie});
            return S_OK;
        }
        HRESULT STDMETHODCALLTYPE Unadvise(DWORD cookie) override {
            for (auto it = connections.begin(); it != connections.end(); ++it) {
                if (it->cookie == cookie) {
                    IDispatch* sink = it->sink;
                    connections.erase(it);
                    sink->Release();
                    return S_OK;
                }
            }
            return CONNECT_E_NOCONNECTION;
        }
        HRESULT STDMETHODCALLTYPE EnumConnections(IEnumConnections** enumerator) override {
            if (enumerator)
                *enumerator = nullptr;
            return E_NOTIMPL;
        }
        void UnadviseAll() {
            std::vector<Connection> left = std::exchange(connections, {});
            for (Connection& c : left)
                c.sink->Release();
        }

        const IID eventIid;
        std::vector<Connection> connections;
        ULONG references = 1;

    private:
        EventSource* m_owner;
        DWORD m_lastCookie = 0;
    };

    Point m_point;
};

} // namespace vaskel_test
