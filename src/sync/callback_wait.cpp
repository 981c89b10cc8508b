#include "message_loop_wait.h"

#include <vaskel/timer.h>

namespace vaskel {

namespace {

const DWORD kPollPause = 500;

} // namespace

bool WaitOnCallbackWithMessageLoop(EWaitCommand (*callback)(DWORD), DWORD value, DWORD timeout,
                                   bool abortable) {
    if (callback == nullptr)
        return false;
    return WaitOnPollWithMessageLoop([callback, value] { return callback(value); }, timeout,
                                     abortable);
}

bool WaitOnCallback(EWaitCommand (*callback)(DWORD), DWORD value, DWORD timeout) {
    if (callback == nullptr)
        return false;
    CVKTimer timer(timeout, tuMilliseconds);
    timer.Start(true);
    bool inputArrived = false;
    for (;;) {
        const EWaitCommand answer = callback(value);
        if (answer != WaitContinue)
            return answer == WaitDone;
        if (timer.GetRemainingTime(tuMilliseconds) == 0)
            return false;
        // The messages stay where they are, so input counts as new until
        // someone looks at the queue: watching it again would not pause at
        // all. New input cuts one pause short.
        if (inputArrived)
            Sleep(kPollPause);
        else
            inputArrived = MsgWaitForMultipleObjects(0, nullptr, FALSE, kPollPause, QS_ALLINPUT) ==
                           WAIT_OBJECT_0;
    }
}

bool WaitOnTimeOutWithMessageLoop(DWORD timeout, bool abortable) {
    return WaitOnPollWithMessageLoop([] { return WaitContinue; }, timeout, abortable);
}

bool CallbackWait::Wait(DWORD timeout, bool abortable) const {
    return WaitOnPollWithMessageLoop(
        [this] { return m_callback ? m_callback(m_nValue) : WaitAbort; }, timeout, abortable);
}

bool CallbackWait::Wait(Callback callback, DWORD value, DWORD timeout, bool abortable) {
    return CallbackWait(std::move(callback), value).Wait(timeout, abortable);
}

} // namespace vaskel
