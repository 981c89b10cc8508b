#include "module_lifetime.h"

#include "../diag/debug_conditions.h"
#include "../queue/queue_thread_startup.h"
#include "../sync/message_loop_wait.h"

#include <vaskel/queue.h>

namespace vaskel {

void ModuleStartup() {
    CreateQueueThreadStartup();
    // A refusal is not fatal: the first window to be created tries again.
    CVKMsgWnd::GetMsgWndClassName();
    RegisterAbortWaitingLoopMessage();
}

void ModuleShutdown() {
    ReleaseQueueThreadStartup();
    ReleaseDebugConditions();
}

} // namespace vaskel
