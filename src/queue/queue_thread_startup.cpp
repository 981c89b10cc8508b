#include "queue_thread_startup.h"

#include <vaskel/diag.h>

namespace vaskel {
namespace {

HANDLE startEvent = nullptr;
CRITICAL_SECTION creationLock;

} // namespace

void CreateQueueThreadStartup() {
    startEvent = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    if (startEvent == nullptr)
        throw resource_error();
    InitializeCriticalSection(&creationLock);
}

void ReleaseQueueThreadStartup() {
    if (startEvent == nullptr)
        return;
    CloseHandle(startEvent);
    startEvent = nullptr;
    DeleteCriticalSection(&creationLock);
}

HANDLE QueueThreadStartEvent() {
    return startEvent;
}

CRITICAL_SECTION& QueueThreadCreationLock() {
    return creationLock;
}

} // namespace vaskel
