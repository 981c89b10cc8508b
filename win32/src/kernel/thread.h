// Thread objects: waitable, signalled when the thread ends.
#pragma once

#include "wait.h"

#include <functional>
#include <memory>

namespace vkw32 {

class Thread : public Waitable {
public:
    bool IsSignaled() const override { return m_finished; }

    void Finish(KernelLock& lock, DWORD exitCode);

    DWORD id = 0;
    DWORD exitCode = STILL_ACTIVE;
    DWORD suspendCount = 0;
    bool started = false;
    std::condition_variable_any stateChanged; // start and resume handshakes

private:
    bool m_finished = false;
};

// The calling thread's object, made on first use for threads that
// CreateThread did not start; it is signalled when the thread ends.
std::shared_ptr<Thread> CurrentThreadObject();

// Runs when a thread ends, on that thread, before its object is signalled:
// other parts of the subset release what the thread owned.
void AddThreadExitHook(std::function<void()> hook);

} // namespace vkw32
