// Posting, sending, retrieving and dispatching messages, and the wait that
// also watches the thread's queue.
#include "message_queue.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <map>
#include <string>

namespace vkw32 {
namespace {

const HWND threadMessagesOnly = reinterpret_cast<HWND>(static_cast<LONG_PTR>(-1));

// Built before the lock is taken: reading the clock need not hold it.
MSG MakeMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    MSG msg = {};
    msg.hwnd = window;
    msg.message = message;
    msg.wParam = wParam;
    msg.lParam = lParam;
    msg.time = GetTickCount();
    return msg;
}

BOOL Post(KernelLock& lock, MessageQueue& queue, const MSG& msg) {
    queue.posted.push_back(msg);
    queue.Arrived(lock, QS_POSTMESSAGE | QS_ALLPOSTMESSAGE);
    return TRUE;
}

bool Matches(const MSG& msg, HWND window, UINT filterMin, UINT filterMax) {
    // WM_QUIT is always retrieved, whatever the filter.
    if (msg.message == WM_QUIT)
        return true;
    if (window == threadMessagesOnly ? msg.hwnd != nullptr : window && msg.hwnd != window)
        return false;
    if (filterMin == 0 && filterMax == 0)
        return true;
    return msg.message >= filterMin && msg.message <= filterMax;
}

// Under the lock: the first posted message that matches, or WM_QUIT when the
// quit flag is up and no posted message is waiting.
bool TakePosted(MessageQueue& queue, HWND window, UINT filterMin, UINT filterMax, bool remove,
                MSG* out) {
    for (auto it = queue.posted.begin(); it != queue.posted.end(); ++it) {
        if (Matches(*it, window, filterMin, filterMax)) {
            *out = *it;
            if (remove && it == queue.posted.begin())
                queue.posted.pop_front();
            else if (remove)
                queue.posted.erase(it);
            if (out->hwnd && !CachedWindow(out->hwnd))
                RememberWindow(*FindWindow(out->hwnd));
            return true;
        }
    }
    if (queue.quitPending && queue.posted.empty()) {
        *out = MSG();
        out->message = WM_QUIT;
        out->wParam = static_cast<WPARAM>(queue.quitCode);
        out->time = GetTickCount();
        if (remove)
            queue.quitPending = false;
        return true;
    }
    return false;
}

bool ValidFilter(HWND window) {
    if (window == nullptr || window == threadMessagesOnly)
        return true;
    KernelLock lock;
    Window* found = FindWindow(window);
    return found && found->threadId == GetCurrentThreadId();
}

// Sends to another thread's window and waits for the answer, running the
// messages sent to this thread meanwhile so that two threads may send to
// each other. Returns false on time-out or when the message was not handled.
bool SendAcross(const std::shared_ptr<MessageQueue>& target, HWND window, UINT message,
                WPARAM wParam, LPARAM lParam, DWORD milliseconds, LRESULT& result) {
    const std::shared_ptr<MessageQueue>& own = CurrentQueue();
    auto sent = std::make_shared<SentMessage>(window, message, wParam, lParam);
    {
        KernelLock lock;
        target->sent.push_back(sent);
        target->hasSent = true;
        target->Arrived(lock, QS_SENDMESSAGE);
    }
    auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(milliseconds);
    std::shared_ptr<Waitable> answer = sent;
    for (;;) {
        ProcessSentMessages(own);
        DWORD remaining = INFINITE;
        if (milliseconds != INFINITE) {
            auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
                deadline - std::chrono::steady_clock::now());
            remaining = static_cast<DWORD>(std::max<long long>(0, left.count()));
        }
        DWORD outcome = WaitForObjects(&answer, 1, false, remaining, own.get(), QS_SENDMESSAGE);
        if (outcome == WAIT_OBJECT_0)
            break;
        if (outcome == WAIT_TIMEOUT) {
            // The message stays queued: the receiver may still handle it.
            SetLastError(ERROR_TIMEOUT);
            return false;
        }
    }
    KernelLock lock;
    result = sent->result;
    if (!sent->delivered)
        SetLastError(ERROR_INVALID_WINDOW_HANDLE);
    return sent->delivered;
}

// A send: a direct call on the window's own thread, else across threads.
bool Send(HWND window, UINT message, WPARAM wParam, LPARAM lParam, DWORD milliseconds,
          LRESULT& result) {
    result = 0;
    std::shared_ptr<MessageQueue> target;
    {
        KernelLock lock;
        Window* found = FindWindow(window);
        if (!found)
            return false;
        if (found->threadId != GetCurrentThreadId())
            target = found->queue;
    }
    if (!target) {
        result = CallCurrentProcedure(window, message, wParam, lParam);
        return true;
    }
    return SendAcross(target, window, message, wParam, lParam, milliseconds, result);
}

struct RegisteredMessages {
    std::map<std::string, UINT> numbers; // by lower-case name
    UINT next = 0xC000;
};

} // namespace
} // namespace vkw32

using vkw32::KernelLock;

extern "C" BOOL WINAPI PostThreadMessageA(DWORD threadId, UINT message, WPARAM wParam,
                                          LPARAM lParam) {
    MSG msg = vkw32::MakeMessage(nullptr, message, wParam, lParam);
    // Like any call of the window services, it gives the caller a queue.
    if (threadId == GetCurrentThreadId())
        vkw32::CurrentQueue();
    KernelLock lock;
    std::shared_ptr<vkw32::MessageQueue> queue = vkw32::QueueOfThread(threadId);
    if (!queue) {
        SetLastError(ERROR_INVALID_THREAD_ID);
        return FALSE;
    }
    return vkw32::Post(lock, *queue, msg);
}

extern "C" BOOL WINAPI PostMessageA(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    MSG msg = vkw32::MakeMessage(window, message, wParam, lParam);
    if (window == nullptr) {
        // A thread message to the caller itself.
        const std::shared_ptr<vkw32::MessageQueue>& own = vkw32::CurrentQueue();
        KernelLock lock;
        return vkw32::Post(lock, *own, msg);
    }
    KernelLock lock;
    vkw32::Window* found = vkw32::FindWindow(window);
    if (!found)
        return FALSE;
    return vkw32::Post(lock, *found->queue, msg);
}

extern "C" void WINAPI PostQuitMessage(int exitCode) {
    const std::shared_ptr<vkw32::MessageQueue>& own = vkw32::CurrentQueue();
    KernelLock lock;
    own->quitPending = true;
    own->quitCode = exitCode;
    own->Arrived(lock, QS_POSTMESSAGE | QS_ALLPOSTMESSAGE);
}

extern "C" LRESULT WINAPI SendMessageA(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    LRESULT result;
    vkw32::Send(window, message, wParam, lParam, INFINITE, result);
    return result;
}

extern "C" LRESULT WINAPI SendMessageTimeoutA(HWND window, UINT message, WPARAM wParam,
                                              LPARAM lParam, UINT /*flags*/, UINT timeout,
                                              PDWORD_PTR result) {
    LRESULT answer;
    bool handled = vkw32::Send(window, message, wParam, lParam, timeout, answer);
    if (result)
        *result = static_cast<DWORD_PTR>(answer);
    return handled ? TRUE : FALSE;
}

extern "C" BOOL WINAPI GetMessageA(LPMSG message, HWND window, UINT filterMin, UINT filterMax) {
    if (message == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return -1;
    }
    if (!vkw32::ValidFilter(window))
        return -1;
    const std::shared_ptr<vkw32::MessageQueue>& own = vkw32::CurrentQueue();
    for (;;) {
        vkw32::ProcessSentMessages(own);
        {
            KernelLock lock;
            own->changedBits = 0;
            if (!own->sent.empty())
                continue;
            if (vkw32::TakePosted(*own, window, filterMin, filterMax, true, message))
                return message->message != WM_QUIT;
        }
        vkw32::WaitForObjects(nullptr, 0, false, INFINITE, own.get(), QS_ALLINPUT);
    }
}

extern "C" BOOL WINAPI PeekMessageA(LPMSG message, HWND window, UINT filterMin, UINT filterMax,
                                    UINT removeMessage) {
    if (message == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    const std::shared_ptr<vkw32::MessageQueue>& own = vkw32::CurrentQueue();
    for (;;) {
        vkw32::ProcessSentMessages(own);
        KernelLock lock;
        // A message sent meanwhile is handled before the input counts as seen.
        if (!own->sent.empty())
            continue;
        own->changedBits = 0;
        return vkw32::TakePosted(*own, window, filterMin, filterMax,
                                 (removeMessage & PM_REMOVE) != 0, message);
    }
}

extern "C" BOOL WINAPI TranslateMessage(const MSG* /*message*/) {
    return FALSE; // no keyboard input reaches these windows
}

extern "C" LRESULT WINAPI DispatchMessageA(const MSG* message) {
    if (message == nullptr || message->hwnd == nullptr)
        return 0;
    if (const vkw32::WindowCache* cached = vkw32::CachedWindow(message->hwnd))
        return CallWindowProcA(cached->procedure, message->hwnd, message->message, message->wParam,
                               message->lParam);
    WNDPROC procedure;
    {
        KernelLock lock;
        vkw32::Window* found = vkw32::FindWindow(message->hwnd);
        if (!found)
            return 0;
        if (found->threadId != GetCurrentThreadId()) {
            SetLastError(ERROR_INVALID_WINDOW_HANDLE);
            return 0;
        }
        procedure = found->procedure;
    }
    return CallWindowProcA(procedure, message->hwnd, message->message, message->wParam,
                           message->lParam);
}

extern "C" UINT WINAPI RegisterWindowMessageA(LPCSTR name) {
    if (name == nullptr || *name == '\0') {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    std::string key(name);
    std::transform(key.begin(), key.end(), key.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
    static auto* registered = new vkw32::RegisteredMessages;
    KernelLock lock;
    auto it = registered->numbers.find(key);
    if (it != registered->numbers.end())
        return it->second;
    if (registered->next > 0xFFFF) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return 0;
    }
    return registered->numbers[key] = registered->next++;
}

extern "C" DWORD WINAPI MsgWaitForMultipleObjects(DWORD count, const HANDLE* handles, BOOL waitAll,
                                                  DWORD milliseconds, DWORD wakeMask) {
    // One slot is the queue's.
    if (count > MAXIMUM_WAIT_OBJECTS - 1) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return WAIT_FAILED;
    }
    std::array<std::shared_ptr<vkw32::Waitable>, MAXIMUM_WAIT_OBJECTS> objects;
    if (vkw32::ResolveWaitHandles(count, handles, waitAll != FALSE, objects.data()) == WAIT_FAILED)
        return WAIT_FAILED;
    const std::shared_ptr<vkw32::MessageQueue>& own = vkw32::CurrentQueue();
    return vkw32::WaitForObjects(objects.data(), count, waitAll != FALSE, milliseconds, own.get(),
                                 wakeMask);
}
