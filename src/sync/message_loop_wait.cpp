#include "message_loop_wait.h"

#include <vaskel/timer.h>

#include <algorithm>

namespace vaskel {

namespace {

const char kAbortWaitingLoopMessageName[] = "7ceeb3d3-d59e-11d3-8394-00c04f7bdf10";
// The longest pause between two questions to a wait's poll.
const DWORD kLongestPollPause = 500;

// Set at start-up, before any thread can wait.
UINT g_abortWaitingLoopMessage = 0;

// Removes and dispatches the calling thread's messages on behalf of one wait,
// and keeps a quit that it takes from the queue for the thread's own loop.
class MessagePump {
public:
    enum Outcome { Drained, Aborted, Stopped };

    explicit MessagePump(bool abortable) : m_abortable(abortable) {}

    // Dispatches every waiting message, asking `stop` after each one.
    template <class Stop>
    Outcome Run(Stop stop) {
        MSG msg;
        while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
            if (m_abortable && msg.message == g_abortWaitingLoopMessage)
                return Aborted;
            if (msg.message == WM_QUIT) {
                m_quitSeen = true;
                m_exitCode = static_cast<int>(msg.wParam);
            }
            TranslateMessage(&msg);
            DispatchMessageA(&msg);
            if (stop())
                return Stopped;
        }
        return Drained;
    }

    // Called on every normal return of the wait; an exception leaves the
    // quit behind.
    template <class Result>
    Result Finish(Result result) const {
        if (m_quitSeen)
            PostQuitMessage(m_exitCode);
        return result;
    }

private:
    bool m_abortable;
    bool m_quitSeen = false;
    int m_exitCode = 0;
};

// How often a message wait for several handles at once looks at them.
const DWORD kWaitAllPollPause = 10;

// Waits for the handles (any or all) or new input. The platform's message wait
// for all handles also waits for new input, so it would sleep on with every
// handle signalled while no message comes: that case looks at the handles
// between short waits for input instead.
DWORD WaitForHandlesOrInput(DWORD count, HANDLE* handles, BOOL waitAll, DWORD timeout) {
    if (!waitAll || count <= 1)
        return MsgWaitForMultipleObjects(count, handles, FALSE, timeout, QS_ALLINPUT);
    CVKTimer timer(timeout, tuMilliseconds);
    timer.Start(true);
    for (;;) {
        DWORD remaining = timeout == INFINITE ? INFINITE : timer.GetRemainingTime(tuMilliseconds);
        DWORD pause = std::min(remaining, kWaitAllPollPause);
        DWORD result = MsgWaitForMultipleObjects(0, nullptr, FALSE, pause, QS_ALLINPUT);
        if (result == WAIT_OBJECT_0)
            return WAIT_OBJECT_0 + count;
        if (result != WAIT_TIMEOUT)
            return result;
        result = WaitForMultipleObjects(count, handles, TRUE, 0);
        if (result != WAIT_TIMEOUT || remaining == 0)
            return result;
    }
}

} // namespace

void RegisterAbortWaitingLoopMessage() {
    g_abortWaitingLoopMessage = RegisterWindowMessageA(kAbortWaitingLoopMessageName);
}

DWORD GetAbortWaitingLoopMessageId() {
    return g_abortWaitingLoopMessage;
}

void PostAbortWaitingLoopMessage(DWORD threadId) {
    PostThreadMessageA(threadId != 0 ? threadId : GetCurrentThreadId(), g_abortWaitingLoopMessage,
                       0, 0);
}

DWORD WaitOnMultipleHandlesWithMessageLoop(DWORD count, HANDLE* handles, BOOL waitAll,
                                           DWORD timeout, bool abortable) {
    if (handles == nullptr && count != 0) { // some platforms read the array before checking it
        SetLastError(ERROR_INVALID_PARAMETER);
        return WAIT_FAILED;
    }
    MessagePump pump(abortable);
    for (;;) {
        DWORD result = WAIT_TIMEOUT;
        const MessagePump::Outcome outcome = pump.Run([&] {
            result = WaitForMultipleObjects(count, handles, waitAll, 0);
            return result < WAIT_OBJECT_0 + count;
        });
        if (outcome == MessagePump::Aborted)
            return pump.Finish<DWORD>(WAIT_TIMEOUT);
        if (outcome == MessagePump::Stopped)
            return pump.Finish(result);
        result = WaitForHandlesOrInput(count, handles, waitAll, timeout);
        if (result != WAIT_OBJECT_0 + count) // not just new input
            return pump.Finish(result);
    }
}

bool WaitOnHandleWithMessageLoop(HANDLE handle, DWORD timeout, bool abortable) {
    return WaitOnMultipleHandlesWithMessageLoop(1, &handle, FALSE, timeout, abortable) ==
           WAIT_OBJECT_0;
}

bool WaitOnPollWithMessageLoop(const std::function<EWaitCommand()>& ask, DWORD timeout,
                               bool abortable) {
    CVKTimer timer(timeout, tuMilliseconds);
    timer.Start(true);
    MessagePump pump(abortable);
    EWaitCommand answer = ask();
    while (answer == WaitContinue) {
        const MessagePump::Outcome outcome = pump.Run([&] {
            answer = ask();
            return answer != WaitContinue;
        });
        if (outcome == MessagePump::Aborted)
            return pump.Finish(false);
        if (outcome == MessagePump::Stopped)
            break;
        const DWORD remaining = timer.GetRemainingTime(tuMilliseconds);
        if (remaining == 0)
            return pump.Finish(false);
        // No handles: only new input or the pause ends it.
        MsgWaitForMultipleObjects(0, nullptr, FALSE, std::min(remaining, kLongestPollPause),
                                  QS_ALLINPUT);
        answer = ask();
    }
    return pump.Finish(answer == WaitDone);
}

} // namespace vaskel
