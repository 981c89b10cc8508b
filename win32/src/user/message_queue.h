// A thread's message queue and the windows it owns. All of it is guarded by
// the kernel's wait lock, so a post, a send and the waits that watch the queue
// see one consistent state; window procedures always run outside the lock.
#pragma once

#include "../kernel/wait.h"

#include <vkwin32/user.h>

#include <atomic>
#include <deque>
#include <memory>

namespace vkw32 {

class MessageQueue;

// A message sent from another thread: the sender waits until it is done.
class SentMessage : public Waitable {
public:
    SentMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam)
        : window(window), message(message), wParam(wParam), lParam(lParam) {}

    bool IsSignaled() const override { return done; }
    void Complete(KernelLock& lock, LRESULT value, bool wasDelivered);

    const HWND window;
    const UINT message;
    const WPARAM wParam;
    const LPARAM lParam;
    LRESULT result = 0;
    bool delivered = false;
    bool done = false;
};

class Window {
public:
    HWND handle = nullptr;
    DWORD threadId = 0;
    std::shared_ptr<MessageQueue> queue;
    WNDPROC procedure = nullptr;
    LONG_PTR id = 0;
    LONG_PTR userData = 0;
    HINSTANCE instance = nullptr;
    HWND parent = nullptr;
    std::string className;
    bool destroying = false;
};

class MessageQueue : public Waitable {
public:
    explicit MessageQueue(DWORD threadId) : threadId(threadId) {}

    // The queue wakes the waits that watch it through its input bits.
    bool IsSignaled() const override { return changedBits != 0; }
    DWORD WakeBits() const override { return changedBits; }

    // New input of the given kind: recorded and announced to the waiters.
    void Arrived(KernelLock& lock, DWORD bits);

    // Under the lock: drops what was posted to a window that is going away.
    void DiscardMessagesOf(HWND window);

    const DWORD threadId;
    std::deque<MSG> posted;
    std::deque<std::shared_ptr<SentMessage>> sent;
    // Whether sent is non-empty, readable without the lock: the common case of
    // no sent message costs no locking.
    std::atomic<bool> hasSent{false};
    bool quitPending = false;
    int quitCode = 0;
    // Input that arrived since the thread last looked at its queue.
    DWORD changedBits = 0;
};

// The calling thread's queue, made on first use. Must not be called with the
// wait lock held.
const std::shared_ptr<MessageQueue>& CurrentQueue();

// Under the wait lock: the queue of a live thread, or null.
std::shared_ptr<MessageQueue> QueueOfThread(DWORD threadId);

// Under the wait lock: a live window (valid while the lock is held), or null
// with ERROR_INVALID_WINDOW_HANDLE.
Window* FindWindow(HWND handle);

// Changes whenever a window goes away or gets another procedure (under the
// lock); readable without it.
unsigned WindowGeneration();
void WindowsChanged();

// What this thread last learnt of the window whose message it took, so that
// dispatching the next one and reading its identifier need no lock while no
// window has changed.
struct WindowCache {
    HWND window = nullptr;
    WNDPROC procedure = nullptr;
    LONG_PTR id = 0;
    unsigned generation = 0;
};
// The cache when it is still good for this window, else null.
const WindowCache* CachedWindow(HWND window);
// Under the lock.
void RememberWindow(const Window& window);

// Runs the messages other threads have sent to this thread, in order.
void ProcessSentMessages(const std::shared_ptr<MessageQueue>& queue);

// Calls the window's current procedure, outside the lock.
LRESULT CallCurrentProcedure(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

} // namespace vkw32
