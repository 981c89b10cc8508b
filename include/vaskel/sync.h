// Synchronisation and lifetime: the lock types, waits that keep the calling
// thread's message loop alive, a table of client windows for notifications,
// and the lifetime marker.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

#include <functional>
#include <utility>

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

// What a wait callback answers. Any other non-zero value stops the wait
// with failure, like WaitAbort.
enum EWaitCommand : int {
    WaitContinue = 0, // keep waiting
    WaitAbort = 1,    // stop; the wait reports false
    WaitDone = 2      // stop; the wait reports true
};

// Waits that pump the calling thread's messages, so that its windows keep
// working and messages sent to them from other threads are answered. While
// they wait, a WM_QUIT does not end them: it is put back into the queue, with
// its exit code, when the wait returns (not when an exception leaves it).
// An abortable wait ends early when it takes the abort-waiting-loop message
// from the queue; a wait that is not abortable dispatches that message like
// any other. Exceptions thrown by callbacks or handlers pass through.

// Returns what the platform wait returns: WAIT_OBJECT_0 + i when handle i
// (with waitAll, every handle) is signalled, WAIT_TIMEOUT on time-out or
// abort, abandoned and failed results as they come (WAIT_FAILED also for a
// null array with a non-zero count). The handles are tested after every
// dispatched message; the time-out counts from the last batch of messages,
// so a steady stream of messages can make the wait longer.
VASKEL_API DWORD WaitOnMultipleHandlesWithMessageLoop(DWORD count, HANDLE* handles, BOOL waitAll,
                                                      DWORD timeout, bool abortable);
// True only when the handle was signalled.
VASKEL_API bool WaitOnHandleWithMessageLoop(HANDLE handle, DWORD timeout, bool abortable);
// Asks callback(value) first, after every dispatched message and at least
// every 500 ms, until it stops the wait or the time-out runs out; true only
// when it answered WaitDone. A null callback fails at once.
VASKEL_API bool WaitOnCallbackWithMessageLoop(EWaitCommand (*callback)(DWORD), DWORD value,
                                              DWORD timeout, bool abortable);
// The same without touching the message queue: between the questions it
// pauses 500 ms, which may overshoot the time-out; the first input to arrive
// cuts one pause short.
VASKEL_API bool WaitOnCallback(EWaitCommand (*callback)(DWORD), DWORD value, DWORD timeout);
// Pumps messages for the time-out; always false, also when aborted.
VASKEL_API bool WaitOnTimeOutWithMessageLoop(DWORD timeout, bool abortable);

// The message registered once per process that ends abortable waits.
VASKEL_API DWORD GetAbortWaitingLoopMessageId();
// Posts the abort message to a thread (0: the calling thread). It ends the
// innermost abortable wait on that thread when the thread next pumps, and
// is lost when no abortable wait takes it.
VASKEL_API void PostAbortWaitingLoopMessage(DWORD threadId);

// A callback and the value it is called with, for a message-loop wait. An
// empty callback answers WaitAbort.
class VASKEL_API CallbackWait {
public:
    using Callback = std::function<EWaitCommand(DWORD)>;

    CallbackWait() = default;
    CallbackWait(Callback callback, DWORD value)
        : m_nValue(value), m_callback(std::move(callback)) {}

    bool Wait(DWORD timeout, bool abortable) const;
    static bool Wait(Callback callback, DWORD value, DWORD timeout, bool abortable);

private:
    DWORD m_nValue = 0;
    Callback m_callback;
};

// A table of client windows in an array the caller owns; a slot holds a
// window or null (free). Every slot update is one interlocked
// compare-exchange, so threads may register, unregister and notify at once
// without a lock; a notification reads each slot once, when it reaches it.
// A null array has no slots.
class VASKEL_API EventsViaHandles {
public:
    EventsViaHandles(HWND* first, DWORD count) : m_pFirst(first), m_nCount(first ? count : 0) {}

    HWND* FirstHandlePointer() const { return m_pFirst; }
    DWORD MaxHandleCount() const { return m_nCount; }

    // False for a null window; true when the window is in the table
    // afterwards. When no slot is free, the slots of windows that no longer
    // exist are freed first; a table full of live windows throws
    // CInvalidArgException and stays unchanged.
    bool RegisterHandle(HWND window);
    // Frees the first slot that holds the window; false when none does.
    bool UnregisterHandle(HWND window);
    bool HandleIsRegistered(HWND window) const;
    // Frees every slot that holds no live window; true when some slot was
    // freed or already free.
    bool FreeInvalideHandles();

    // To every registered window, in slot order.
    void SendMessageToClients(UINT message, WPARAM wParam, LPARAM lParam);
    void PosMessageToClients(UINT message, WPARAM wParam, LPARAM lParam);
    void PosMessageToClientsExcluding(HWND excluded, UINT message, WPARAM wParam, LPARAM lParam);
    // To the first registered window other than the excluded one, only.
    void PosMessageToAnyExcluding(HWND excluded, UINT message, WPARAM wParam, LPARAM lParam);
    void SendMessageToAnyExcluding(HWND excluded, UINT message, WPARAM wParam, LPARAM lParam);

protected:
    // True when the slot held expected and now holds newValue.
    static bool StoreValue(HWND* slot, HWND newValue, HWND expected);

private:
    bool ClaimFreeSlot(HWND window);

    HWND* m_pFirst;
    DWORD m_nCount;
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
