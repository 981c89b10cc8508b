#include "wait.h"

#include <algorithm>
#include <array>
#include <chrono>

namespace vkw32 {
namespace {

AdaptiveMutex& WaitLock() {
    static auto* lock = new AdaptiveMutex; // outlives every static destructor
    return *lock;
}

const std::shared_ptr<WakeSignal>& ThisThreadSignal() {
    thread_local const std::shared_ptr<WakeSignal> signal = std::make_shared<WakeSignal>();
    return signal;
}

} // namespace

AdaptiveMutex::AdaptiveMutex() {
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_ADAPTIVE_NP);
    pthread_mutex_init(&m_mutex, &attributes);
    pthread_mutexattr_destroy(&attributes);
}

AdaptiveMutex::~AdaptiveMutex() {
    pthread_mutex_destroy(&m_mutex);
}

void AdaptiveMutex::lock() {
    pthread_mutex_lock(&m_mutex);
}

void AdaptiveMutex::unlock() {
    pthread_mutex_unlock(&m_mutex);
}

void WakeSignal::Wake() {
    {
        std::lock_guard<std::mutex> lock(mutex);
        woken = true;
    }
    rung.notify_one();
}

KernelLock::KernelLock() : m_lock(WaitLock()) {}

KernelLock::~KernelLock() {
    m_lock.unlock();
    if (m_first)
        m_first->Wake();
    for (const auto& signal : m_more)
        signal->Wake();
}

void KernelLock::WakeLater(const std::shared_ptr<WakeSignal>& signal) {
    if (!m_first)
        m_first = signal;
    else
        m_more.push_back(signal);
}

bool Waiter::TrySatisfy() {
    if (done)
        return false;
    if (waitAll && count > 0) {
        // All objects, and with an input object also new input, as the
        // platform documents for message waits.
        for (DWORD i = 0; i < count; ++i)
            if (!objects[i]->IsSignaled())
                return false;
        if (input && !(input->WakeBits() & inputMask))
            return false;
        for (DWORD i = 0; i < count; ++i)
            objects[i]->Acquire();
        result = WAIT_OBJECT_0;
        done = true;
        return true;
    }
    // The lowest index among the signalled objects, as Windows reports it.
    for (DWORD i = 0; i < count; ++i) {
        if (objects[i]->IsSignaled()) {
            objects[i]->Acquire();
            result = WAIT_OBJECT_0 + i;
            done = true;
            return true;
        }
    }
    if (input && (input->WakeBits() & inputMask)) {
        result = WAIT_OBJECT_0 + count;
        done = true;
        return true;
    }
    return false;
}

void Waitable::Signaled(KernelLock& lock) {
    for (Waiter* waiter : m_waiters) {
        if (!IsSignaled())
            break;
        if (waiter->TrySatisfy())
            lock.WakeLater(waiter->signal);
    }
}

void Waitable::RemoveWaiter(Waiter* waiter) {
    m_waiters.erase(std::find(m_waiters.begin(), m_waiters.end(), waiter));
}

DWORD WaitForObjects(const std::shared_ptr<Waitable>* objects, DWORD count, bool waitAll,
                     DWORD milliseconds, Waitable* input, DWORD inputMask) {
    std::array<Waitable*, MAXIMUM_WAIT_OBJECTS + 1> raw;
    for (DWORD i = 0; i < count; ++i)
        raw[i] = objects[i].get();
    Waiter waiter(raw.data(), count, waitAll, input, inputMask);
    // The input object is watched like the others.
    DWORD watched = count;
    if (input)
        raw[watched++] = input;
    const std::shared_ptr<WakeSignal>& signal = ThisThreadSignal();
    waiter.signal = signal;
    auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
    {
        KernelLock lock;
        if (waiter.TrySatisfy())
            return waiter.result;
        if (milliseconds == 0)
            return WAIT_TIMEOUT;
        for (DWORD i = 0; i < watched; ++i)
            raw[i]->AddWaiter(&waiter);
    }
    for (;;) {
        {
            std::unique_lock<std::mutex> lock(signal->mutex);
            if (milliseconds == INFINITE)
                signal->rung.wait(lock, [&] { return signal->woken; });
            else
                signal->rung.wait_until(lock, deadline, [&] { return signal->woken; });
            signal->woken = false;
        }
        // A wake may be left over from an earlier wait: only the state decides.
        KernelLock lock;
        bool expired = milliseconds != INFINITE && std::chrono::steady_clock::now() >= deadline;
        if (waiter.done || expired) {
            for (DWORD i = 0; i < watched; ++i)
                raw[i]->RemoveWaiter(&waiter);
            return waiter.done ? waiter.result : WAIT_TIMEOUT;
        }
    }
}

DWORD ResolveWaitHandles(DWORD count, const HANDLE* handles, bool waitAll,
                         std::shared_ptr<Waitable>* objects) {
    if (count > 0 && handles == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return WAIT_FAILED;
    }
    for (DWORD i = 0; i < count; ++i) {
        objects[i] = std::dynamic_pointer_cast<Waitable>(LookupHandle(handles[i]));
        if (!objects[i]) {
            SetLastError(ERROR_INVALID_HANDLE);
            return WAIT_FAILED;
        }
        // One object twice in a wait for all could never be taken twice.
        if (waitAll && std::find(objects, objects + i, objects[i]) != objects + i) {
            SetLastError(ERROR_INVALID_PARAMETER);
            return WAIT_FAILED;
        }
    }
    return WAIT_OBJECT_0;
}

namespace {

DWORD WaitOnHandles(DWORD count, const HANDLE* handles, bool waitAll, DWORD milliseconds) {
    if (count == 0 || count > MAXIMUM_WAIT_OBJECTS) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return WAIT_FAILED;
    }
    std::array<std::shared_ptr<Waitable>, MAXIMUM_WAIT_OBJECTS> objects;
    if (ResolveWaitHandles(count, handles, waitAll, objects.data()) == WAIT_FAILED)
        return WAIT_FAILED;
    return WaitForObjects(objects.data(), count, waitAll, milliseconds);
}

} // namespace
} // namespace vkw32

extern "C" DWORD WINAPI WaitForSingleObject(HANDLE object, DWORD milliseconds) {
    return vkw32::WaitOnHandles(1, &object, false, milliseconds);
}

extern "C" DWORD WINAPI WaitForMultipleObjects(DWORD count, const HANDLE* handles, BOOL waitAll,
                                               DWORD milliseconds) {
    return vkw32::WaitOnHandles(count, handles, waitAll != FALSE, milliseconds);
}
