// CKXEventSink: connecting to an event source's connection point, receiving
// events through the dispatch hooks, disconnecting, and the reference counts
// that the connection leaves on sink and source.
#include "support/event_source.h"

#include <vaskel/event_sink.h>

#include <gtest/gtest.h>

#include <cstring>
#include <vector>

namespace {

using vaskel::CCmdTarget;
using vaskel::CKXEventSink;
using vaskel::CRuntimeClass;
using vaskel_test::EventSource;

const IID IID_TestEvents = {
    0x6A0F3C52, 0x1B7D, 0x4C9E, {0x8F, 0x20, 0x5D, 0x41, 0xA3, 0x96, 0x0C, 0x17}};
const IID IID_OtherEvents = {
    0x6A0F3C53, 0x1B7D, 0x4C9E, {0x8F, 0x20, 0x5D, 0x41, 0xA3, 0x96, 0x0C, 0x17}};

// Records the events it receives.
class RecordingSink : public CKXEventSink {
public:
    struct Event {
        DISPID id;
        std::vector<LONG> arguments;
    };

    explicit RecordingSink(bool* destroyed = nullptr) : m_destroyed(destroyed) {
        SetUUID(IID_TestEvents);
    }
    ~RecordingSink() override {
        if (m_destroyed)
            *m_destroyed = true;
    }

    bool HasSource() const { return static_cast<bool>(source); }
    DWORD Cookie() const { return cookie; }
    DWORD References() {
        ExternalAddRef();
        return ExternalRelease();
    }

    std::vector<Event> events;

protected:
    HRESULT OnInvoke(DISPID id, WORD, DISPPARAMS* params, VARIANT*) override {
        Event event{id, {}};
        for (UINT i = 0; i < params->cArgs; ++i)
            event.arguments.push_back(params->rgvarg[i].lVal);
        events.push_back(event);
        return S_OK;
    }

private:
    bool* m_destroyed;
};

VARIANT Long(LONG value) {
    VARIANT v;
    VariantInit(&v);
    v.vt = VT_I4;
    v.lVal = value;
    return v;
}

TEST(CKXEventSink, ReceivesEventsWhileConnected) {
    EventSource source(IID_TestEvents);
    RecordingSink sink;
    ASSERT_NE(sink.ConnectSink(&source), 0);
    EXPECT_TRUE(sink.HasSource());
    EXPECT_NE(sink.Cookie(), 0u);
    ASSERT_EQ(source.ConnectionCount(), 1u);

    EXPECT_EQ(source.Fire(7, {Long(2), Long(1)}), std::vector<HRESULT>{S_OK});
    ASSERT_EQ(sink.events.size(), 1u);
    EXPECT_EQ(sink.events[0].id, 7);
    EXPECT_EQ(sink.events[0].arguments, (std::vector<LONG>{2, 1}));

    EXPECT_NE(sink.DisconnectSink(), 0);
    EXPECT_FALSE(sink.HasSource());
    EXPECT_EQ(sink.Cookie(), 0u);
    EXPECT_EQ(source.ConnectionCount(), 0u);
    EXPECT_TRUE(source.Fire(8).empty());
    EXPECT_EQ(sink.events.size(), 1u);
}

TEST(CKXEventSink, TheConnectionDoesNotKeepTheSinkAlive) {
    EventSource source(IID_TestEvents);
    bool destroyed = false;
    auto* sink = new RecordingSink(&destroyed);
    EXPECT_EQ(sink->References(), 1u);
    ASSERT_NE(sink->ConnectSink(&source), 0);
    // The source's reference was given back; the sink holds the source.
    EXPECT_EQ(sink->References(), 1u);
    EXPECT_EQ(source.references, 2u);
    EXPECT_EQ(source.PointReferences(), 1u);

    EXPECT_NE(sink->DisconnectSink(), 0);
    EXPECT_EQ(sink->References(), 1u);
    EXPECT_EQ(source.references, 1u);
    EXPECT_EQ(source.PointReferences(), 1u);

    // The creator's reference is the only one.
    EXPECT_EQ(sink->ExternalRelease(), 0u);
    EXPECT_TRUE(destroyed);
}

TEST(CKXEventSink, ASourceWithoutTheEventInterfaceIsNotConnected) {
    EventSource source(IID_OtherEvents);
    RecordingSink sink;
    EXPECT_EQ(sink.ConnectSink(&source), 0);
    EXPECT_FALSE(sink.HasSource());
    EXPECT_EQ(sink.Cookie(), 0u);
    EXPECT_EQ(source.references, 1u);
    EXPECT_EQ(source.PointReferences(), 1u);
    EXPECT_EQ(sink.References(), 1u);
}

TEST(CKXEventSink, AnAdviseThatIsRefusedLeavesNothingConnected) {
    // The sink does not answer the source's event interface, so the
    // connection point refuses it.
    EventSource source(IID_OtherEvents);
    CKXEventSink* sink = static_cast<CKXEventSink*>(RUNTIME_CLASS(CKXEventSink)->CreateObject());
    ASSERT_NE(sink, nullptr);
    EXPECT_EQ(sink->ConnectSink(&source), 0);
    EXPECT_EQ(source.ConnectionCount(), 0u);
    EXPECT_EQ(source.references, 1u);
    EXPECT_EQ(sink->ExternalRelease(), 0u);
}

TEST(CKXEventSink, ConnectingAgainMovesTheConnection) {
    EventSource first(IID_TestEvents);
    EventSource second(IID_TestEvents);
    RecordingSink sink;
    ASSERT_NE(sink.ConnectSink(&first), 0);
    ASSERT_NE(sink.ConnectSink(&second), 0);
    EXPECT_EQ(first.ConnectionCount(), 0u);
    EXPECT_EQ(first.references, 1u);
    EXPECT_EQ(second.ConnectionCount(), 1u);
    EXPECT_EQ(second.references, 2u);
    EXPECT_EQ(sink.References(), 1u);

    EXPECT_TRUE(first.Fire(1).empty());
    EXPECT_EQ(second.Fire(2).size(), 1u);
    ASSERT_EQ(sink.events.size(), 1u);
    EXPECT_EQ(sink.events[0].id, 2);

    // Reconnecting to the same source leaves one connection.
    ASSERT_NE(sink.ConnectSink(&second), 0);
    EXPECT_EQ(second.ConnectionCount(), 1u);
    EXPECT_EQ(second.references, 2u);
    EXPECT_NE(sink.DisconnectSink(), 0);
    EXPECT_EQ(second.references, 1u);
}

TEST(CKXEventSink, NothingToDisconnectSucceeds) {
    RecordingSink sink;
    EXPECT_EQ(sink.DisconnectSink(), 1);
    EXPECT_EQ(sink.ConnectSink(nullptr), 0);
    EXPECT_FALSE(sink.HasSource());
    EXPECT_EQ(sink.DisconnectSink(), 1);
}

TEST(CKXEventSink, IsCreatableByName) {
    CRuntimeClass* runtimeClass = CRuntimeClass::FromName("CKXEventSink");
    ASSERT_EQ(runtimeClass, RUNTIME_CLASS(CKXEventSink));
    EXPECT_EQ(runtimeClass->GetBaseClass(), RUNTIME_CLASS(CCmdTarget));
    CCmdTarget* object = runtimeClass->CreateObject();
    ASSERT_NE(object, nullptr);
    EXPECT_TRUE(object->IsKindOf(RUNTIME_CLASS(CKXEventSink)));
    // Automation is on from the start; the last release deletes the sink.
    IDispatch* dispatch = object->GetIDispatch(FALSE);
    ASSERT_NE(dispatch, nullptr);
    EXPECT_EQ(dispatch->Release(), 0u);
}

TEST(CKXEventSink, AnswersTheEventInterfaceWithItsDispatch) {
    RecordingSink sink;
    IDispatch* events = nullptr;
    ASSERT_EQ(
        sink.GetIDispatch(FALSE)->QueryInterface(IID_TestEvents, reinterpret_cast<void**>(&events)),
        S_OK);
    EXPECT_EQ(events, sink.GetIDispatch(FALSE));
    events->Release();
    void* other = nullptr;
    EXPECT_EQ(sink.GetIDispatch(FALSE)->QueryInterface(IID_OtherEvents, &other), E_NOINTERFACE);
}

// The connection-point vocabulary that sinks and sources share, as the
// system defines it.
TEST(ConnectionPoints, ValuesAreTheSystems) {
    EXPECT_EQ(CONNECT_E_NOCONNECTION, static_cast<HRESULT>(0x80040200));
    EXPECT_EQ(CONNECT_E_ADVISELIMIT, static_cast<HRESULT>(0x80040201));
    EXPECT_EQ(CONNECT_E_CANNOTCONNECT, static_cast<HRESULT>(0x80040202));
    EXPECT_EQ(CONNECT_E_OVERRIDDEN, static_cast<HRESULT>(0x80040203));
    const IID* ids[] = {&IID_IConnectionPointContainer, &IID_IEnumConnectionPoints,
                        &IID_IConnectionPoint, &IID_IEnumConnections};
    for (size_t i = 0; i < 4; ++i) {
        EXPECT_EQ(ids[i]->Data1, 0xB196B284u + i);
        EXPECT_EQ(ids[i]->Data2, 0xBAB4);
        EXPECT_EQ(ids[i]->Data3, 0x101A);
        const BYTE tail[8] = {0xB6, 0x9C, 0x00, 0xAA, 0x00, 0x34, 0x1D, 0x07};
        EXPECT_EQ(std::memcmp(ids[i]->Data4, tail, 8), 0);
    }
}

} // namespace
