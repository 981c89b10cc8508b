#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <thread>

using namespace vaskel;

namespace {

const DWORD kSafetyNet = 30000; // ms; only a wait that has gone wrong gets near it
const UINT kSetEvent = WM_USER + 1;

// Sets the event passed as the first parameter of kSetEvent, on its thread.
struct SignalWnd : CVKMsgWnd {
    SignalWnd() { Create(); }
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override {
        if (message != kSetEvent)
            return CVKMsgWnd::OnWndMsg(message, wParam, lParam, result);
        *result = SetEvent(reinterpret_cast<HANDLE>(wParam));
        return true;
    }
    void PostSet(HANDLE event) { PostMessageA(kSetEvent, reinterpret_cast<WPARAM>(event), 0); }
};

void PostToSelf(UINT message, WPARAM wParam = 0) {
    PostThreadMessageA(GetCurrentThreadId(), message, wParam, 0);
}

// Removes the waiting messages without dispatching them.
int TakeWaitingMessages() {
    MSG msg;
    int count = 0;
    while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
        ++count;
    return count;
}

// The exit code of a waiting WM_QUIT, taken out of the queue; -1 without one.
int TakeQuit() {
    MSG msg;
    return PeekMessageA(&msg, nullptr, WM_QUIT, WM_QUIT, PM_REMOVE) ? static_cast<int>(msg.wParam)
                                                                    : -1;
}

bool IsSet(HANDLE event) {
    return WaitForSingleObject(event, 0) == WAIT_OBJECT_0;
}

EWaitCommand AnswerValue(DWORD value) {
    return static_cast<EWaitCommand>(value);
}

int g_asks = 0;

EWaitCommand CountAsks(DWORD) {
    ++g_asks;
    return WaitContinue;
}

// One wait of each kind that ends on an event.
const struct {
    const char* name;
    std::function<bool(HANDLE event, bool abortable)> wait;
} kWaitsForEvent[] = {
    {"handles",
     [](HANDLE event, bool abortable) {
         return WaitOnMultipleHandlesWithMessageLoop(1, &event, FALSE, kSafetyNet, abortable) ==
                WAIT_OBJECT_0;
     }},
    {"callback",
     [](HANDLE event, bool abortable) {
         return CallbackWait::Wait(
             [event](DWORD) { return IsSet(event) ? WaitDone : WaitContinue; }, 0, kSafetyNet,
             abortable);
     }},
};

} // namespace

TEST(MessageLoopWait, SignalledHandlesEndTheWaitAfterTheFirstWaitingMessage) {
    CVKEvent set(true, true), unset(false, true);
    HANDLE handles[] = {unset, set};
    EXPECT_EQ(WaitOnMultipleHandlesWithMessageLoop(2, handles, FALSE, 0, false), WAIT_OBJECT_0 + 1);
    EXPECT_EQ(WaitOnMultipleHandlesWithMessageLoop(2, handles, TRUE, 0, false), WAIT_TIMEOUT);
    EXPECT_EQ(WaitOnMultipleHandlesWithMessageLoop(1, nullptr, FALSE, 0, false), WAIT_FAILED);

    PostToSelf(WM_USER);
    PostToSelf(WM_USER);
    EXPECT_TRUE(WaitOnHandleWithMessageLoop(set, kSafetyNet, false));
    EXPECT_EQ(TakeWaitingMessages(), 1) << "the handle is tested after every message";
}

TEST(MessageLoopWait, AWaitForAllHandlesEndsWithoutAnyMessage) {
    CVKEvent first(false, true), second(false, true);
    HANDLE handles[] = {first, second};
    std::thread other([&] {
        first.SetEvent();
        Sleep(20);
        second.SetEvent(); // and no message to the waiting thread
    });
    EXPECT_EQ(WaitOnMultipleHandlesWithMessageLoop(2, handles, TRUE, kSafetyNet, false),
              WAIT_OBJECT_0);
    other.join();
}

TEST(MessageLoopWait, HandlesMessagesFromAnotherThreadAndKeepsTheQuitForLater) {
    SignalWnd window;
    const HWND handle = window.GetWndHandle();
    for (const auto& kind : kWaitsForEvent) {
        for (bool send : {false, true}) {
            SCOPED_TRACE(testing::Message() << kind.name << (send ? ", sent" : ", posted"));
            CVKEvent event;
            const WPARAM target = reinterpret_cast<WPARAM>(static_cast<HANDLE>(event));
            std::thread other([&, id = GetCurrentThreadId()] {
                PostThreadMessageA(id, WM_QUIT, 7, 0); // comes before the message that ends it
                if (send) // with a safety net, so that a failed wait cannot hang the test
                    SendMessageTimeoutA(handle, kSetEvent, target, 0, SMTO_NORMAL, kSafetyNet,
                                        nullptr);
                else
                    PostMessageA(handle, kSetEvent, target, 0);
            });
            EXPECT_TRUE(kind.wait(event, false));
            other.join();
            EXPECT_EQ(TakeQuit(), 7);
        }
    }
}

TEST(MessageLoopWait, AbortMessageEndsAbortableWaitsAndIsDispatchedByOthers) {
    EXPECT_EQ(GetAbortWaitingLoopMessageId(),
              RegisterWindowMessageA("7ceeb3d3-d59e-11d3-8394-00c04f7bdf10"));
    // The abort comes first, from another thread or this one; the message
    // that would end the wait comes after it.
    SignalWnd window;
    for (const auto& kind : kWaitsForEvent) {
        for (bool abortable : {true, false}) {
            SCOPED_TRACE(testing::Message() << kind.name << ", abortable " << abortable);
            CVKEvent event(false, true); // stays set for the check below
            if (abortable)
                std::thread([id = GetCurrentThreadId()] {
                    PostAbortWaitingLoopMessage(id);
                }).join();
            else
                PostAbortWaitingLoopMessage(0);
            window.PostSet(event);
            EXPECT_EQ(kind.wait(event, abortable), !abortable);
            EXPECT_EQ(IsSet(event), !abortable) << "an abortable wait stops at the abort";
            EXPECT_EQ(TakeWaitingMessages(), abortable ? 1 : 0);
        }
    }
}

TEST(CallbackWaits, AnswersEndTheWaitTimeOutsAskOnceAndExceptionsPassThrough) {
    PostToSelf(WM_USER);
    for (DWORD answer : {2, 1, 3}) { // done, abort, any other stop
        SCOPED_TRACE(answer);
        const bool done = answer == 2;
        EXPECT_EQ(WaitOnCallbackWithMessageLoop(AnswerValue, answer, kSafetyNet, false), done);
        EXPECT_EQ(WaitOnCallback(AnswerValue, answer, kSafetyNet), done);
        EXPECT_EQ(CallbackWait(AnswerValue, answer).Wait(kSafetyNet, false), done);
    }
    EXPECT_FALSE(CallbackWait().Wait(kSafetyNet, false)) << "an empty callback aborts";
    g_asks = 0;
    EXPECT_FALSE(WaitOnCallback(CountAsks, 0, 0));
    EXPECT_EQ(g_asks, 1);
    g_asks = 0;
    EXPECT_FALSE(WaitOnCallback(CountAsks, 0, 50));
    EXPECT_LE(g_asks, 3) << "pauses although the waiting message stays new";
    EXPECT_EQ(TakeWaitingMessages(), 1) << "none of them pumped";

    PostToSelf(WM_USER);
    PostToSelf(WM_USER);
    g_asks = 0;
    EXPECT_FALSE(WaitOnCallbackWithMessageLoop(CountAsks, 0, 0, false));
    EXPECT_EQ(g_asks, 3) << "first, then after each message";
    PostToSelf(WM_USER);
    EXPECT_FALSE(WaitOnTimeOutWithMessageLoop(0, false));
    EXPECT_EQ(TakeWaitingMessages(), 0);

    // The quit taken from the queue stays taken when an exception ends the wait.
    PostToSelf(WM_QUIT, 9);
    auto throwSecond = [asks = 0](DWORD) mutable -> EWaitCommand {
        if (++asks == 2)
            throw std::runtime_error("callback");
        return WaitContinue;
    };
    EXPECT_THROW(CallbackWait::Wait(throwSecond, 0, kSafetyNet, false), std::runtime_error);
    EXPECT_EQ(TakeQuit(), -1);
}
