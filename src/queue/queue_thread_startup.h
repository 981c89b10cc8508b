// The state all queue threads share for their start-up handshake: one start
// event and one creation lock, made when the library is loaded and released
// when it is unloaded.
#pragma once

#include <vaskel/win32.h>

namespace vaskel {

// Throws resource_error when the event cannot be created.
void CreateQueueThreadStartup();
void ReleaseQueueThreadStartup();

HANDLE QueueThreadStartEvent();
CRITICAL_SECTION& QueueThreadCreationLock();

} // namespace vaskel
