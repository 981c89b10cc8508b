// Waiting on kernel objects. All wait state is guarded by one process-wide
// lock. Whoever signals an object hands it directly to the waiters it can
// satisfy, in the order they began to wait, so an auto-reset object is
// consumed only by the one wait it satisfies, a wait for all objects takes
// them together or not at all, and a pulse releases exactly the waiters
// present at that moment. Satisfied waiters are woken after the lock is
// released, so that they do not wake only to block on it.
#pragma once

#include "handle_table.h"

#include <vkwin32/kernel.h>
#include <vkwin32/synch.h>

#include <condition_variable>
#include <memory>
#include <mutex>
#include <vector>

namespace vkw32 {

class Waitable;

// A thread's wake-up call. Shared, so that a signaller can still ring it
// after the waiter has returned (the waiter then sees a harmless extra wake).
struct WakeSignal {
    void Wake();

    std::mutex mutex;
    std::condition_variable rung;
    bool woken = false;
};

// Holds the wait lock; wakes the waiters satisfied meanwhile on release.
class KernelLock {
public:
    KernelLock();
    ~KernelLock();
    KernelLock(const KernelLock&) = delete;
    KernelLock& operator=(const KernelLock&) = delete;

    void WakeLater(const std::shared_ptr<WakeSignal>& signal);
    std::unique_lock<std::mutex>& Lock() { return m_lock; }

private:
    std::unique_lock<std::mutex> m_lock;
    std::shared_ptr<WakeSignal> m_first; // almost always the only one
    std::vector<std::shared_ptr<WakeSignal>> m_more;
};

struct Waiter {
    Waiter(Waitable* const* objects, DWORD count, bool waitAll)
        : objects(objects), count(count), waitAll(waitAll) {}

    // Under the wait lock: when the wait can be satisfied now, takes the
    // objects it needs and records the result.
    bool TrySatisfy();

    Waitable* const* objects;
    DWORD count;
    bool waitAll;
    bool done = false;
    DWORD result = WAIT_TIMEOUT;
    std::shared_ptr<WakeSignal> signal;
};

class Waitable : public KernelObject {
public:
    // Everything below runs under the wait lock.
    virtual bool IsSignaled() const = 0;
    // A satisfied wait takes the object; auto-reset objects become
    // non-signalled by it.
    virtual void Acquire() {}

protected:
    // Hands the object, newly signalled, to the waiters it can satisfy.
    void Signaled(KernelLock& lock);

private:
    friend DWORD WaitForObjects(const std::shared_ptr<Waitable>* objects, DWORD count, bool waitAll,
                                DWORD milliseconds);
    std::vector<Waiter*> m_waiters;
};

// The wait itself; objects are kept alive by the caller's references.
DWORD WaitForObjects(const std::shared_ptr<Waitable>* objects, DWORD count, bool waitAll,
                     DWORD milliseconds);

} // namespace vkw32
