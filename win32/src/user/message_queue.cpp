#include "message_queue.h"

#include "../kernel/hot_tls.h"
#include "../kernel/thread.h"
#include "window_table.h"

#include <algorithm>
#include <mutex>
#include <unordered_map>

namespace vkw32 {
namespace {

std::unordered_map<DWORD, std::shared_ptr<MessageQueue>>& Queues() {
    static auto* queues = new std::unordered_map<DWORD, std::shared_ptr<MessageQueue>>;
    return *queues;
}

// When a thread ends, its windows go (without messages: the thread can no
// longer run their procedures), its queue goes, and every message sent to
// it and not yet handled is answered with 0.
void TearDownQueue(const std::shared_ptr<MessageQueue>& queue) {
    KernelLock lock;
    auto it = Queues().find(queue->threadId);
    if (it == Queues().end() || it->second != queue)
        return;
    Queues().erase(it);
    for (HWND window : WindowsOfThread(queue->threadId))
        RemoveWindow(window);
    for (const auto& sent : queue->sent)
        sent->Complete(lock, 0, false);
    queue->sent.clear();
    queue->hasSent = false;
    queue->posted.clear();
}

struct QueueHolder {
    std::shared_ptr<MessageQueue> queue;
    ~QueueHolder() {
        if (queue)
            TearDownQueue(queue);
    }
};

VKW32_HOT_TLS thread_local QueueHolder currentQueue;

} // namespace

void SentMessage::Complete(KernelLock& lock, LRESULT value, bool wasDelivered) {
    result = value;
    delivered = wasDelivered;
    done = true;
    Signaled(lock);
}

void MessageQueue::DiscardMessagesOf(HWND window) {
    posted.erase(std::remove_if(posted.begin(), posted.end(),
                                [window](const MSG& msg) { return msg.hwnd == window; }),
                 posted.end());
}

void MessageQueue::Arrived(KernelLock& lock, DWORD bits) {
    changedBits |= bits;
    Signaled(lock);
}

const std::shared_ptr<MessageQueue>& CurrentQueue() {
    if (!currentQueue.queue) {
        static std::once_flag hookAdded;
        // Threads started by CreateThread tear their queue down before their
        // handle is signalled; every other thread when its thread-local
        // storage goes.
        std::call_once(hookAdded, [] {
            AddThreadExitHook([] {
                if (currentQueue.queue)
                    TearDownQueue(currentQueue.queue);
            });
        });
        auto queue = std::make_shared<MessageQueue>(GetCurrentThreadId());
        KernelLock lock;
        Queues()[queue->threadId] = queue;
        currentQueue.queue = std::move(queue);
    }
    return currentQueue.queue;
}

std::shared_ptr<MessageQueue> QueueOfThread(DWORD threadId) {
    auto it = Queues().find(threadId);
    return it == Queues().end() ? nullptr : it->second;
}

void ProcessSentMessages(const std::shared_ptr<MessageQueue>& queue) {
    while (queue->hasSent.load(std::memory_order_acquire)) {
        std::shared_ptr<SentMessage> sent;
        WNDPROC procedure = nullptr;
        {
            KernelLock lock;
            queue->changedBits &= ~static_cast<DWORD>(QS_SENDMESSAGE);
            if (queue->sent.empty())
                return;
            sent = std::move(queue->sent.front());
            queue->sent.pop_front();
            queue->hasSent = !queue->sent.empty();
            if (auto window = FindWindow(sent->window))
                procedure = window->procedure;
        }
        // The sender is answered even when the procedure throws.
        struct Answer {
            std::shared_ptr<SentMessage>& sent;
            LRESULT result = 0;
            bool delivered = false;
            ~Answer() {
                KernelLock lock;
                sent->Complete(lock, result, delivered);
            }
        } answer{sent};
        if (procedure) {
            answer.result =
                CallWindowProcA(procedure, sent->window, sent->message, sent->wParam, sent->lParam);
            answer.delivered = true;
        }
    }
}

LRESULT CallCurrentProcedure(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    WNDPROC procedure = nullptr;
    {
        KernelLock lock;
        if (auto found = FindWindow(window))
            procedure = found->procedure;
    }
    return procedure ? CallWindowProcA(procedure, window, message, wParam, lParam) : 0;
}

} // namespace vkw32
