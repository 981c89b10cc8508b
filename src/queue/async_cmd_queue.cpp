#include "sync_async_cmd.h"

#include <vaskel/diag.h>
#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <algorithm>

namespace vaskel {
namespace {

const UINT processMessage = WM_APP + 2;

// The queue's lock for a scope, which may be left early and is left at the
// end if still held.
class QueueLock {
public:
    explicit QueueLock(CRITICAL_SECTION& lock) : m_lock(&lock) { EnterCriticalSection(m_lock); }
    ~QueueLock() { Leave(); }
    QueueLock(const QueueLock&) = delete;
    QueueLock& operator=(const QueueLock&) = delete;
    void Leave() {
        if (m_lock)
            LeaveCriticalSection(m_lock);
        m_lock = nullptr;
    }

private:
    CRITICAL_SECTION* m_lock;
};

// A processing step's share of the liveness counter, returned on every way
// out; the last share frees the counter.
class LivenessShare {
public:
    explicit LivenessShare(int* counter) : m_counter(counter) { ++*m_counter; }
    ~LivenessShare() {
        if (--*m_counter == 0)
            delete m_counter;
    }
    LivenessShare(const LivenessShare&) = delete;
    LivenessShare& operator=(const LivenessShare&) = delete;
    // The queue's own share and this one: the queue still exists.
    bool QueueAlive() const { return *m_counter > 1; }

private:
    int* m_counter;
};

} // namespace

CVKAsyncCmdQueue::CVKAsyncCmdQueue(DWORD priorities)
    : m_nPriorities(std::max<DWORD>(priorities, 1)),
      m_levels(static_cast<size_t>(m_nPriorities) + 1), m_strQueueName("No name"),
      m_pLiveness(new int(1)) {
    InitializeCriticalSection(&m_lock);
}

CVKAsyncCmdQueue::~CVKAsyncCmdQueue() {
    if (QueueWindowExists()) {
        EmptyQueue();
        DestroyQueueWindow();
    }
    if (--*m_pLiveness == 0)
        delete m_pLiveness;
    m_levels.clear(); // owned commands still stored are deleted untold
    DeleteCriticalSection(&m_lock);
}

bool CVKAsyncCmdQueue::Create() {
    return CVKMsgWnd::Create();
}

void CVKAsyncCmdQueue::Destroy(bool cancelPending) {
    if (!cancelPending)
        WaitUntilQueueIsEmpty();
    EmptyQueue();
    DestroyQueueWindow();
}

DWORD CVKAsyncCmdQueue::LevelOf(DWORD priority) const {
    DWORD level = priority + 1; // the send level's all-ones wraps to 0
    if (level > m_nPriorities)
        throw unexpected_error();
    return level;
}

void CVKAsyncCmdQueue::QueueCmd(old_auto_ptr<CVKAsyncCmd>& cmd, DWORD priority) {
    QueueLock lock(m_lock);
    Level& level = m_levels[LevelOf(priority)];
    level.push_back(cmd); // takes the ownership flag over
    m_nQueuedCmds.fetch_add(1);
    PostQueueProcessMessage();
}

void CVKAsyncCmdQueue::QueueCmd(CVKAsyncCmd* cmd, DWORD priority) {
    old_auto_ptr<CVKAsyncCmd> owned(cmd); // deletes the command if queueing throws
    QueueCmd(owned, priority);
}

void CVKAsyncCmdQueue::QueueStaticCmd(CVKAsyncCmd& cmd, DWORD priority) {
    old_auto_ptr<CVKAsyncCmd> borrowed(&cmd);
    borrowed.release();
    QueueCmd(borrowed, priority);
}

void CVKAsyncCmdQueue::QueueSyncCmd(old_auto_ptr<CVKAsyncCmd>& cmd, DWORD priority,
                                    bool messageLoop) {
    QueueSyncCmd(*cmd, priority, messageLoop);
}

void CVKAsyncCmdQueue::QueueSyncCmd(CVKAsyncCmd& cmd, DWORD priority, bool messageLoop) {
    CVKEvent done(false, true);
    CVKSyncAsyncCmd<CVKEvent> wrapper(done, &cmd);
    WaitForSent(wrapper, done, priority, messageLoop);
}

void CVKAsyncCmdQueue::WaitForSent(CVKAsyncCmd& wrapper, HANDLE done, DWORD priority,
                                   bool messageLoop) {
    HWND window = GetWndHandle();
    QueueStaticCmd(wrapper, priority);
    bool finished = false;
    if (IsWindow(window)) {
        finished = messageLoop ? WaitOnHandleWithMessageLoop(done, INFINITE, true)
                               : WaitForSingleObject(done, INFINITE) == WAIT_OBJECT_0;
    }
    if (finished)
        return;
    // The wait ended early or there is no window: the wrapper lives on this
    // stack and must not stay behind. Still queued, it is withdrawn and
    // cancelled here; already taken out, it is running or being cancelled
    // right now, and this returns only once that is over.
    bool withdrawn = false;
    {
        QueueLock lock(m_lock);
        for (Level& level : m_levels) {
            auto it = std::find_if(
                level.begin(), level.end(),
                [&](const old_auto_ptr<CVKAsyncCmd>& entry) { return entry.get() == &wrapper; });
            if (it != level.end()) {
                level.erase(it);
                m_nQueuedCmds.fetch_sub(1);
                withdrawn = true;
                break;
            }
        }
    }
    if (withdrawn)
        wrapper.Canceled();
    else
        WaitForSingleObject(done, INFINITE);
}

void CVKAsyncCmdQueue::SendCmd(CVKAsyncCmd& cmd) {
    SendCmd(cmd, false);
}

void CVKAsyncCmdQueue::SendCmd(CVKAsyncCmd& cmd, bool messageLoop) {
    QueueSyncCmd(cmd, SendLevelPriority, messageLoop);
}

void CVKAsyncCmdQueue::SendCmdMsgLoop(CVKAsyncCmd& cmd) {
    SendCmd(cmd, true);
}

void CVKAsyncCmdQueue::SendCmd(CVKAsyncCmd& cmd, void* event) {
    CVKEvent::ResetEvent(event);
    QueueCmd(new CVKSyncAsyncCmd<CVKEvent>(event, &cmd), SendLevelPriority);
}

DWORD CVKAsyncCmdQueue::AddQueueLock() {
    return static_cast<DWORD>(m_nQueueLocks.fetch_add(1) + 1);
}

DWORD CVKAsyncCmdQueue::ReleaseQueueLock() {
    LONG locks = m_nQueueLocks.load();
    do {
        if (locks == 0)
            return 0;
    } while (!m_nQueueLocks.compare_exchange_weak(locks, locks - 1));
    if (locks == 1 && m_nQueuedCmds.load() > 0)
        PostQueueProcessMessage();
    return static_cast<DWORD>(locks - 1);
}

DWORD CVKAsyncCmdQueue::CalcQueueSize() const {
    QueueLock lock(m_lock);
    size_t total = 0;
    for (const Level& level : m_levels)
        total += level.size();
    return static_cast<DWORD>(total);
}

bool CVKAsyncCmdQueue::CalcIsQueueEmpty() const {
    return CalcQueueSize() == 0;
}

DWORD CVKAsyncCmdQueue::GetQueueSize(DWORD priority) const {
    QueueLock lock(m_lock);
    return static_cast<DWORD>(m_levels[LevelOf(priority)].size());
}

DWORD CVKAsyncCmdQueue::GetPriorities() const {
    return m_nPriorities;
}

bool CVKAsyncCmdQueue::ProcessSingleQueueCmd() {
    QueueLock lock(m_lock);
    int* liveness = m_pLiveness; // outlives the queue while this step runs
    LivenessShare share(liveness);
    if (m_nQueueLocks.load() > 0 && m_levels[0].empty())
        return false;
    auto level = std::find_if(m_levels.begin(), m_levels.end(),
                              [](const Level& candidate) { return !candidate.empty(); });
    if (level != m_levels.end()) {
        old_auto_ptr<CVKAsyncCmd> cmd(level->front()); // deletes an owned command on every way out
        level->pop_front();
        m_nQueuedCmds.fetch_sub(1);
        lock.Leave();
        cmd->Execute();
    }
    // A command may have destroyed the queue: touch it only if it is alive.
    return share.QueueAlive() && m_nQueuedCmds.load() > 0;
}

void CVKAsyncCmdQueue::PostQueueProcessMessage() {
    LONG idle = 0;
    if (m_nProcessMessagePending.compare_exchange_strong(idle, 1))
        CVKMsgWnd::PostMessageA(processMessage, 0, 0);
}

bool CVKAsyncCmdQueue::OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) {
    if (message != processMessage)
        return CVKMsgWnd::OnWndMsg(message, wParam, lParam, result);
    m_nProcessMessagePending.fetch_sub(1);
    *result = 0;
    // A step further up this thread's stack is running a message loop: the
    // work goes on when it returns.
    if (*m_pLiveness > 1)
        return true;
    if (ProcessSingleQueueCmd())
        PostQueueProcessMessage();
    return true;
}

void CVKAsyncCmdQueue::ProcessQueue() {
    ProcessSingleQueueCmd();
}

void CVKAsyncCmdQueue::ProcessEntireQueue() {
    while (ProcessSingleQueueCmd()) {
    }
}

void CVKAsyncCmdQueue::WaitUntilQueueIsEmpty() {
    if (IsQueueEmpty())
        return;
    if (IsQueueThread()) {
        ProcessEntireQueue();
        return;
    }
    CVKEvent reached(false, true);
    CVKEmptySyncAsyncCmd<CVKEvent> marker(reached);
    const DWORD leastUrgent = m_nPriorities - 1;
    while (!IsQueueEmpty()) {
        reached.ResetEvent();
        QueueStaticCmd(marker, leastUrgent);
        WaitForSingleObject(reached, INFINITE);
    }
}

void CVKAsyncCmdQueue::ClearQueue(Level& level) {
    for (old_auto_ptr<CVKAsyncCmd>& cmd : level)
        cmd->Canceled();
    level.clear();
}

void CVKAsyncCmdQueue::EmptyQueue(DWORD priority) {
    Level taken;
    {
        QueueLock lock(m_lock);
        Level& level = m_levels[LevelOf(priority)];
        taken.swap(level);
        m_nQueuedCmds.fetch_sub(static_cast<DWORD>(taken.size()));
    }
    ClearQueue(taken);
}

void CVKAsyncCmdQueue::EmptyQueue() {
    std::vector<Level> taken;
    {
        QueueLock lock(m_lock);
        taken.resize(m_levels.size());
        taken.swap(m_levels);
        m_nQueuedCmds.store(0);
    }
    for (Level& level : taken)
        ClearQueue(level);
}

} // namespace vaskel
