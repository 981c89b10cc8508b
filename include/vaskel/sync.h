// Synchronisation and lifetime: the lock types and the lifetime marker.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

namespace vaskel {

// The four lock types share the shape bool Lock(DWORD timeout) / bool Unlock(),
// so code templated on a lock type takes any of them. None of them can be
// copied: a copy would duplicate a live critical section, flag or handle.

// A recursive critical section: the owning thread may lock it again and must
// unlock it as often. Lock ignores its time-out and waits as long as it takes.
class VASKEL_API CVKCriticalSection {
public:
    CVKCriticalSection();
    ~CVKCriticalSection();
    CVKCriticalSection(const CVKCriticalSection&) = delete;
    CVKCriticalSection& operator=(const CVKCriticalSection&) = delete;

    bool Lock(DWORD timeout) const;
    bool Unlock() const;
    // Snapshots of the owner, taken without locking: IsLocked may be stale by
    // the time the caller acts, while a true IsLockedByCurrentThread stays
    // true until this thread unlocks.
    bool IsLocked() const;
    bool IsLockedByCurrentThread() const;

    operator _RTL_CRITICAL_SECTION*() const { return &m_cs; }

private:
    mutable CRITICAL_SECTION m_cs;
};

// A spin flag for very short regions: not recursive (a second Lock on the
// same thread spins for ever) and not fair. Lock ignores its time-out.
class VASKEL_API CVKSimpleMutex {
public:
    CVKSimpleMutex() = default;
    CVKSimpleMutex(const CVKSimpleMutex&) = delete;
    CVKSimpleMutex& operator=(const CVKSimpleMutex&) = delete;

    bool Lock(DWORD timeout);
    // False when the mutex was not taken.
    bool Unlock();

    static LONG GetLockedFlag() { return 1; }
    static LONG GetUnlockedFlag() { return 0; }

private:
    volatile LONG m_nFlag = 0;
};

// A lock for code written against a lock type that needs none.
class VASKEL_API CVKFakeMutex {
public:
    CVKFakeMutex() = default;
    CVKFakeMutex(const CVKFakeMutex&) = delete;
    CVKFakeMutex& operator=(const CVKFakeMutex&) = delete;

    bool Lock(DWORD /*timeout*/) const { return true; }
    bool Unlock() const { return true; }
};

// An owned event handle. Lock waits for the event; Unlock has nothing to
// release. Note the order of the flags: initial state first, reset mode second.
class VASKEL_API CVKEvent {
public:
    // Opens the event when a named one exists; throws resource_error when the
    // platform refuses.
    explicit CVKEvent(bool initialState = false, bool manualReset = false,
                      const char* name = nullptr, SECURITY_ATTRIBUTES* attributes = nullptr);
    ~CVKEvent();
    CVKEvent(const CVKEvent&) = delete;
    CVKEvent& operator=(const CVKEvent&) = delete;

    // True only when the event was signalled within the time-out.
    bool Lock(DWORD timeout);
    bool Unlock() { return true; }

    bool SetEvent() { return SetEvent(m_hEvent); }
    bool PulseEvent() { return PulseEvent(m_hEvent); }
    bool ResetEvent() { return ResetEvent(m_hEvent); }
    // The same on any event handle the caller owns; false when the platform
    // refuses, as for a null handle.
    static bool SetEvent(void* handle);
    static bool PulseEvent(void* handle);
    static bool ResetEvent(void* handle);

    operator void*() const { return m_hEvent; }

private:
    HANDLE m_hEvent;
};

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
