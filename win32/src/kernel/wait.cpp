#include "wait.h"

#include <algorithm>
#include <array>
#include <chrono>

namespace vkw32 {
namespace {

std::mutex& WaitLock() {
    static std::mutex* lock = new std::mutex; // outlives every static destructor
    return *lock;
}

const std::shared_ptr<WakeSignal>& ThisThreadSignal() {
    thread_local const std::shared_ptr<WakeSignal> signal = std::make_shared<WakeSignal>();
    return signal;
}

} // namespace

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
    if (waitAll) {
        for (DWORD i = 0; i < count; ++i)
            if (!objects[i]->IsSignaled())
                return false;
        for (DWORD i = 0; i < count; ++i)
            objects[i]->Acquire();
        result = WAIT_OBJECT_0;
    } else {
        // The lowest index among the signalled objects, as Windows reports it.
        DWORD i = 0;
        while (i < count && !objects[i]->IsSignaled())
            ++i;
        if (i == count)
            return false;
        objects[i]->Acquire();
        result = WAIT_OBJECT_0 + i;
    }
    done = true;
    return true;
}

void Waitable::Signaled(KernelLock& lock) {
    for (Waiter* waiter : m_waiters) {
        if (!IsSignaled())
            break;
        if (waiter->TrySatisfy())
            lock.WakeLater(waiter->signal);
    }
}

DWORD WaitForObjects(const std::shared_ptr<Waitable>* objects, DWORD count, bool waitAll,
                     DWORD milliseconds) {
    std::array<Waitable*, MAXIMUM_WAIT_OBJECTS> raw;
    for (DWORD i = 0; i < count; ++i)
        raw[i] = objects[i].get();
    Waiter waiter(raw.data(), count, waitAll);
    const std::shared_ptr<WakeSignal>& signal = ThisThreadSignal();
    waiter.signal = signal;
    auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
    {
        KernelLock lock;
        if (waiter.TrySatisfy())
            return waiter.result;
        if (milliseconds == 0)
            return WAIT_TIMEOUT;
        for (DWORD i = 0; i < count; ++i)
            raw[i]->m_waiters.push_back(&waiter);
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
            for (DWORD i = 0; i < count; ++i) {
                auto& list = raw[i]->m_waiters;
                list.erase(std::find(list.begin(), list.end(), &waiter));
            }
            return waiter.done ? waiter.result : WAIT_TIMEOUT;
        }
    }
}

namespace {

DWORD WaitOnHandles(DWORD count, const HANDLE* handles, bool waitAll, DWORD milliseconds) {
    if (count == 0 || count > MAXIMUM_WAIT_OBJECTS || handles == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return WAIT_FAILED;
    }
    std::array<std::shared_ptr<Waitable>, MAXIMUM_WAIT_OBJECTS> objects;
    for (DWORD i = 0; i < count; ++i) {
        objects[i] = std::dynamic_pointer_cast<Waitable>(LookupHandle(handles[i]));
        if (!objects[i]) {
            SetLastError(ERROR_INVALID_HANDLE);
            return WAIT_FAILED;
        }
        // One object twice in a wait for all could never be taken twice.
        if (waitAll &&
            std::find(objects.begin(), objects.begin() + i, objects[i]) != objects.begin() + i) {
            SetLastError(ERROR_INVALID_PARAMETER);
            return WAIT_FAILED;
        }
    }
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
