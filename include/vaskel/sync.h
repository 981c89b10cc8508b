// Synchronisation and lifetime: the lifetime marker.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

namespace vaskel {

// A one-word member that tells whether its object is alive, being torn down
// or destroyed, also to code that runs after the object may have gone (a
// callback, a nested message loop). The word holds a State or the address of
// the first watcher record; each record's second word continues the chain,
// which ends in the marker's State.
class VASKEL_API SimpleDestroyedMarker {
public:
    enum State : INT_PTR { Alive = 0, Destroying = 1, Destroyed = 2 };

    // A record that links itself into a marker's chain and keeps answering
    // after the marker is gone. Watchers are unlinked by their destructors.
    class Watcher {
    public:
        explicit Watcher(SimpleDestroyedMarker& marker) : m_marker(&marker) {
            m_state = marker.m_state;
            marker.m_state = static_cast<State>(reinterpret_cast<INT_PTR>(this));
        }
        ~Watcher() {
            if (HoldsState(m_state) && m_state == Destroyed)
                return; // the marker is gone and dissolved the chain
            State* link = &m_marker->m_state;
            while (*link != static_cast<State>(reinterpret_cast<INT_PTR>(this)))
                link = &RecordAt(*link)->m_state;
            *link = m_state;
        }
        Watcher(const Watcher&) = delete;
        Watcher& operator=(const Watcher&) = delete;

        State GetState() const { return FollowChain(m_state); }
        bool IsAlive() const { return GetState() == Alive; }
        bool IsDestroying() const { return GetState() == Destroying; }
        bool IsDestroyed() const { return GetState() == Destroyed; }

    private:
        friend class SimpleDestroyedMarker;
        SimpleDestroyedMarker* m_marker; // first word
        State m_state;                   // second word: the chain goes on here
    };

    SimpleDestroyedMarker() : m_state(Alive) {}
    ~SimpleDestroyedMarker();
    SimpleDestroyedMarker(const SimpleDestroyedMarker&) = delete;
    SimpleDestroyedMarker& operator=(const SimpleDestroyedMarker&) = delete;

    State GetState() const { return FollowChain(m_state); }
    bool IsAlive() const { return GetState() == Alive; }
    bool IsDestroying() const { return GetState() == Destroying; }
    bool IsDestroyed() const { return GetState() == Destroyed; }
    void SetDestroying();

protected:
    bool HasState() const { return HoldsState(m_state); }
    State& AsState() const { return m_state; }

private:
    // Addresses are compared unsigned: a record in the upper half of the
    // address space is still a record, never mistaken for a State.
    static bool HoldsState(State word) {
        return static_cast<UINT_PTR>(word) <= static_cast<UINT_PTR>(Destroyed);
    }
    static Watcher* RecordAt(State word) {
        return reinterpret_cast<Watcher*>(static_cast<INT_PTR>(word));
    }
    static State FollowChain(State word) {
        while (!HoldsState(word))
            word = RecordAt(word)->m_state;
        return word;
    }

    mutable State m_state;
};

} // namespace vaskel
