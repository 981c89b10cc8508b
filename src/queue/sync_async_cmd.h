// The queue's internal commands that release a waiting sender. EventOps names
// the event vocabulary: a static SetEvent(void* handle).
#pragma once

#include <vaskel/queue.h>

namespace vaskel {

namespace detail {

// Sets the event when the scope ends, also while an exception passes, so that
// the sender is released before the exception reaches anyone.
template <class EventOps>
class SetEventOnExit {
public:
    explicit SetEventOnExit(void* event) : m_event(event) {}
    ~SetEventOnExit() { EventOps::SetEvent(m_event); }
    SetEventOnExit(const SetEventOnExit&) = delete;
    SetEventOnExit& operator=(const SetEventOnExit&) = delete;

private:
    void* m_event;
};

} // namespace detail

// Runs or cancels another command, then sets an event.
template <class EventOps>
class CVKSyncAsyncCmd : public CVKAsyncCmd {
public:
    CVKSyncAsyncCmd(void* event, CVKAsyncCmd* cmd) : m_hEvent(event), m_pCmd(cmd) {}

    void Execute() override {
        detail::SetEventOnExit<EventOps> release(m_hEvent);
        m_pCmd->Execute();
    }
    void Canceled() override {
        detail::SetEventOnExit<EventOps> release(m_hEvent);
        m_pCmd->Canceled();
    }

private:
    void* m_hEvent;      // not owned
    CVKAsyncCmd* m_pCmd; // not owned
};

// A marker with no work: running or cancelling it only sets the event.
template <class EventOps>
class CVKEmptySyncAsyncCmd : public CVKAsyncCmd {
public:
    explicit CVKEmptySyncAsyncCmd(void* event) : m_hEvent(event) {}

    void Execute() override { EventOps::SetEvent(m_hEvent); }
    void Canceled() override { EventOps::SetEvent(m_hEvent); }

private:
    void* m_hEvent; // not owned
};

} // namespace vaskel
