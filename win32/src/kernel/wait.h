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
#include <pthread.h>
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

// The wait lock: held briefly and often by every thread that posts, sends or
// waits, so a contender spins a little before it sleeps.
class AdaptiveMutex {
public:
    AdaptiveMutex();
    ~AdaptiveMutex();
    AdaptiveMutex(const AdaptiveMutex&) = delete;
    AdaptiveMutex& operator=(const AdaptiveMutex&) = delete;
    void lock();
    void unlock();

private:
    pthread_mutex_t m_mutex;
};

// Holds the wait lock; wakes the waiters satisfied meanwhile on release.
class KernelLock {
public:
    KernelLock();
    ~KernelLock();
    KernelLock(const KernelLock&) = delete;
    KernelLock& operator=(const KernelLock&) = delete;

    void WakeLater(const std::shared_ptr<WakeSignal>& signal);
    std::unique_lock<AdaptiveMutex>& Lock() { return m_lock; }

private:
    std::unique_lock<AdaptiveMutex> m_lock;
    std::shared_ptr<WakeSignal> m_first; // almost always the only one
    std::vector<std::shared_ptr<WakeSignal>> m_more;
};

struct Waiter {
    Waiter(Waitable* const* objects, DWORD count, bool waitAll, Waitable* input, DWORD inputMask)
        : objects(objects), count(count), waitAll(waitAll), input(input), inputMask(inputMask) {}

    // Under the wait lock: when the wait can be satisfied now, takes the
    // objects it needs and records the result. Waiting for any: the objects
    // come first, new input of the watched kinds is the alternative (result
    // count). Waiting for all: every object and, with an input object, new
    // input too.
    bool TrySatisfy();

    Waitable* const* objects;
    DWORD count;
    bool waitAll;
    Waitable* input;
    DWORD inputMask;
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
    // The kinds of input that arrived since the owner last looked (QS_ bits);
    // only message queues have any.
    virtual DWORD WakeBits() const { return 0; }

    // Under the wait lock, by the waiting thread.
    void AddWaiter(Waiter* waiter) { m_waiters.push_back(waiter); }
    void RemoveWaiter(Waiter* waiter);

protected:
    // Hands the object, newly signalled, to the waiters it can satisfy.
    void Signaled(KernelLock& lock);

private:
    std::vector<Waiter*> m_waiters;
};

// The wait itself; objects are kept alive by the caller's references. With
// an input object, new input of the kinds in inputMask also ends the wait.
DWORD WaitForObjects(const std::shared_ptr<Waitable>* objects, DWORD count, bool waitAll,
                     DWORD milliseconds, Waitable* input = nullptr, DWORD inputMask = 0);

// Resolves handles for a wait: WAIT_OBJECT_0 when all are waitable, else
// WAIT_FAILED with the last error set.
DWORD ResolveWaitHandles(DWORD count, const HANDLE* handles, bool waitAll,
                         std::shared_ptr<Waitable>* objects);

} // namespace vkw32
