#include "queue_thread_startup.h"

#include <vaskel/diag.h>
#include <vaskel/queue.h>
#include <vaskel/sync.h>

namespace vaskel {

CVKAsyncCmdQueueThread::CVKAsyncCmdQueueThread(DWORD priorities) : CVKAsyncCmdQueue(priorities) {
    m_bAutoDelete = false;
    m_pMainWnd = &m_placeholderWnd;
}

CVKAsyncCmdQueueThread::~CVKAsyncCmdQueueThread() {
    if (m_hEndedThread)
        CloseHandle(m_hEndedThread);
}

bool CVKAsyncCmdQueueThread::Create(DWORD createFlags, UINT stackSize,
                                    LPSECURITY_ATTRIBUTES attributes) {
    if (createFlags & CREATE_SUSPENDED)
        return false;
    CRITICAL_SECTION& creationLock = QueueThreadCreationLock();
    EnterCriticalSection(&creationLock);
    HANDLE started = QueueThreadStartEvent();
    ResetEvent(started);
    if (!CreateThread(createFlags, stackSize, attributes)) {
        LeaveCriticalSection(&creationLock);
        return false;
    }
    // Kept before the thread can retire them in ExitInstance.
    HANDLE thread = m_hThread;
    DWORD threadId = m_nThreadID;
    WaitForSingleObject(started, INFINITE);
    if (QueueWindowExists()) {
        LeaveCriticalSection(&creationLock);
        return true;
    }
    // The start failed: the thread ends, or is made to.
    EmptyQueue();
    DestroyQueueWindow();
    PostThreadMessageA(threadId, WM_QUIT, 0, 0);
    if (!m_bAutoDelete && GetCurrentThreadId() != threadId)
        WaitOnHandleWithMessageLoop(thread, INFINITE, false);
    LeaveCriticalSection(&creationLock);
    return false;
}

int CVKAsyncCmdQueueThread::InitInstance() {
    HANDLE started = QueueThreadStartEvent();
    m_bComInitialized = CoInitialize(nullptr) == S_OK;
    if (!m_bComInitialized) {
        SetEvent(started);
        return false;
    }
    if (!GetQueueName().IsEmpty())
        VKSetThreadName(GetQueueName(), 0xFFFFFFFF);
    bool created = CVKAsyncCmdQueue::Create();
    SetEvent(started);
    return created;
}

int CVKAsyncCmdQueueThread::OnIdle(LONG /*count*/) {
    return 0;
}

int CVKAsyncCmdQueueThread::ExitInstance() {
    EmptyQueue();
    DestroyQueueWindow();
    if (m_bComInitialized)
        CoUninitialize();
    m_bComInitialized = false;
    // Created() and IsInThreadCtx() answer false from here on; the handle
    // stays open for whoever waits for the end.
    m_hEndedThread = m_hThread;
    m_hThread = nullptr;
    m_nThreadID = 0;
    return CWinThread::ExitInstance();
}

void CVKAsyncCmdQueueThread::Destroy(bool cancelPending) {
    if (!m_hThread)
        return;
    if (!cancelPending)
        WaitUntilQueueIsEmpty();
    EmptyQueue();
    DestroyQueueWindow();
    HANDLE thread = m_hThread;
    bool wait = !m_bAutoDelete && !IsInThreadCtx();
    // With the auto-delete flag the object may be gone once the quit is posted.
    PostThreadMessageA(m_nThreadID, WM_QUIT, 0, 0);
    if (wait)
        WaitOnHandleWithMessageLoop(thread, INFINITE, false);
}

void CVKAsyncCmdQueueThread::DestroyThread(CVKAsyncCmdQueueThread* thread, bool cancelPending) {
    if (thread == nullptr)
        return;
    if (!thread->Created()) {
        delete thread;
        return;
    }
    thread->m_bAutoDelete = true;
    thread->Destroy(cancelPending);
}

bool CVKAsyncCmdQueueThread::IsAlive() const {
    DWORD code = 0;
    return m_hThread && GetExitCodeThread(m_hThread, &code) && code == STILL_ACTIVE;
}

bool CVKAsyncCmdQueueThread::IsInThreadCtx() const {
    return m_nThreadID != 0 && m_nThreadID == GetCurrentThreadId();
}

void CVKAsyncCmdQueueThread::SetQueueName(const CString& name) {
    CVKAsyncCmdQueue::SetQueueName(name);
    if (m_hThread)
        VKSetThreadName(name, m_nThreadID);
}

} // namespace vaskel
