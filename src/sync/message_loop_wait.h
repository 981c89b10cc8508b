// The engine of the message-loop waits, and the start-up step that registers
// their abort message.
#pragma once

#include <vaskel/sync.h>

#include <functional>

namespace vaskel {

// Registers the abort-waiting-loop message; the library's start-up calls it
// once, before any wait can run.
void RegisterAbortWaitingLoopMessage();

// Asks `ask` first, after every dispatched message and at least every 500 ms
// while pumping the calling thread's messages; true only when it answered
// WaitDone. The time-out is in milliseconds.
bool WaitOnPollWithMessageLoop(const std::function<EWaitCommand()>& ask, DWORD timeout,
                               bool abortable);

} // namespace vaskel
