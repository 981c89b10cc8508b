// Commands, the ownership that carries them into and out of queues, and the
// message windows that bring work onto a thread.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/framework/win_thread.h>
#include <vaskel/win32.h>

#include <atomic>
#include <deque>
#include <vector>

namespace vaskel {

// One piece of work to run later, usually on another thread. A queued command
// is told either Execute() or Canceled(), never both.
struct VASKEL_API CVKAsyncCmd {
    CVKAsyncCmd() = default;
    CVKAsyncCmd(const CVKAsyncCmd&) = default;
    CVKAsyncCmd& operator=(const CVKAsyncCmd&) = default;
    virtual ~CVKAsyncCmd();

    virtual void Execute() = 0;
    // Called instead of Execute() when the command leaves a queue unrun.
    virtual void Canceled();
};

// An owning pointer with a separate ownership flag. Copying hands the flag
// over and leaves the source pointing at the object without owning it, so the
// queue can tell the commands it must delete from those that live elsewhere.
template <class T>
class old_auto_ptr {
public:
    explicit old_auto_ptr(T* object = nullptr) noexcept
        : m_owner(object != nullptr), m_ptr(object) {}
    old_auto_ptr(const old_auto_ptr& other) noexcept
        : m_owner(other.m_owner), m_ptr(other.release()) {}
    template <class U>
    old_auto_ptr(const old_auto_ptr<U>& other) noexcept
        : m_owner(other.owns()), m_ptr(other.release()) {}

    old_auto_ptr& operator=(const old_auto_ptr& other) {
        if (this != &other) {
            if (m_ptr != other.get()) {
                if (m_owner)
                    delete m_ptr;
                m_owner = other.m_owner;
            } else if (other.m_owner) {
                m_owner = true;
            }
            m_ptr = other.release();
        }
        return *this;
    }

    ~old_auto_ptr() {
        if (m_owner && m_ptr)
            delete m_ptr;
    }

    T& operator*() const noexcept { return *m_ptr; }
    T* operator->() const noexcept { return m_ptr; }
    T* get() const noexcept { return m_ptr; }
    bool owns() const noexcept { return m_owner; }
    // Gives up ownership and keeps pointing at the object.
    T* release() const noexcept {
        m_owner = false;
        return m_ptr;
    }

private:
    mutable bool m_owner;
    T* m_ptr;
};

// An invisible, message-only window of the shared class "KXMSGWNDCLASS" that
// turns the messages it receives into OnWndMsg calls on its owning thread.
// The window finds its object through its control identifier, which holds
// the object's address. Copying is forbidden: two objects would own one
// window.
class VASKEL_API CVKMsgWnd {
public:
    CVKMsgWnd() = default;
    virtual ~CVKMsgWnd();
    CVKMsgWnd(const CVKMsgWnd&) = delete;
    CVKMsgWnd& operator=(const CVKMsgWnd&) = delete;

    // Registers the class on first use; null when the platform refuses, and
    // the next call tries again.
    static const char* GetMsgWndClassName();

    // Creates the window on the calling thread, which then owns it; true
    // when a window exists afterwards (also when it existed before).
    bool Create();
    // On the window's thread the window goes at once. From another thread
    // the object lets go of it at once and asks the window's thread to
    // destroy it, waiting up to 3 seconds for the answer.
    void Destroy();
    bool Created() const { return m_hWnd.load() != nullptr; }
    HWND GetWndHandle() const { return m_hWnd.load(); }
    bool IsInThreadCtx() const;

    // Without a window these reach the calling thread's own queue, as the
    // platform does for a null window: check Created() first.
    bool PostMessageA(UINT message, WPARAM wParam, LPARAM lParam);
    bool PostMessageDebug(UINT message, WPARAM wParam, LPARAM lParam);
    // True when the handler's result is non-zero.
    bool SendMessageA(UINT message, WPARAM wParam, LPARAM lParam);

protected:
    // Returns true when it handled the message and stored the result.
    // Overrides pass what they do not handle to this version, which lets go
    // of the window on WM_DESTROY and destroys it on WM_APP.
    virtual bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result);
    static LRESULT CALLBACK WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);
    // The procedure of a window its object has let go of: it only answers
    // the destroy request.
    static LRESULT CALLBACK WindowProcDestroy(HWND window, UINT message, WPARAM wParam,
                                              LPARAM lParam);

private:
    // Written by Create, Destroy and WM_DESTROY; read from any thread.
    std::atomic<HWND> m_hWnd{nullptr};
    static std::atomic<const char*> m_lpszWndClassName;
};

// The same machine on a window class the caller names. An existing class of
// that name is used as it is (its procedure sees the creation messages);
// otherwise one is registered. A cross-thread Destroy posts the destroy
// request and returns at once.
class VASKEL_API CVKNamedClassWnd {
public:
    explicit CVKNamedClassWnd(const CString& className);
    virtual ~CVKNamedClassWnd();
    CVKNamedClassWnd(const CVKNamedClassWnd&) = delete;
    CVKNamedClassWnd& operator=(const CVKNamedClassWnd&) = delete;

    bool Create();
    void Destroy();
    bool Created() const { return m_hWnd.load() != nullptr; }
    HWND GetWndHandle() const { return m_hWnd.load(); }
    bool IsInThreadCtx() const;

protected:
    virtual bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result);
    static LRESULT CALLBACK WindowProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam);
    static LRESULT CALLBACK WindowProcDestroy(HWND window, UINT message, WPARAM wParam,
                                              LPARAM lParam);
    // Registers the class when it does not exist yet; null when that fails.
    // Nothing is cached: every call asks the platform.
    const char* GetMsgWndClassName() const;

private:
    std::atomic<HWND> m_hWnd{nullptr};
    CString m_strClassName;
};

// Runs commands on the thread that created its window, in priority order and
// first in, first out within a priority, one command per processing message
// so that the thread's other messages interleave. Priority p (0 the most
// urgent) is level p + 1; level 0 is the send level (priority 0xFFFFFFFF),
// the only one that runs while the queue is locked. A command may run a
// nested message loop or destroy the queue that runs it.
class VASKEL_API CVKAsyncCmdQueue : protected CVKMsgWnd {
public:
    static const DWORD SendLevelPriority = 0xFFFFFFFF;

    // 0 priorities means 1.
    explicit CVKAsyncCmdQueue(DWORD priorities = 1);
    // Cancels pending commands when the window still exists and destroys it;
    // commands still stored without a window are deleted untold.
    ~CVKAsyncCmdQueue() override;
    CVKAsyncCmdQueue(const CVKAsyncCmdQueue&) = delete;
    CVKAsyncCmdQueue& operator=(const CVKAsyncCmdQueue&) = delete;

    // Creates the window on the calling thread, which becomes the queue's
    // thread. Commands may be queued only afterwards.
    bool Create();
    // Lets pending commands run first unless cancelPending, then cancels what
    // is left and destroys the window.
    void Destroy(bool cancelPending);

    const CString& GetQueueName() const { return m_strQueueName; }
    void SetQueueName(const CString& name) { m_strQueueName = name; }

    // An invalid priority throws unexpected_error and stores nothing. The
    // pointer forms hand the command over (deleted if queueing throws); the
    // reference forms leave it to the caller, who keeps it alive until it ran
    // or was cancelled.
    void QueueCmd(old_auto_ptr<CVKAsyncCmd>& cmd, DWORD priority);
    void QueueCmd(CVKAsyncCmd* cmd, DWORD priority);
    void QueueStaticCmd(CVKAsyncCmd& cmd, DWORD priority);
    // Return when the command has run or been cancelled; with messageLoop the
    // wait pumps the caller's messages and ends early on the abort-waiting
    // message, and a command still queued then is withdrawn and cancelled.
    void QueueSyncCmd(old_auto_ptr<CVKAsyncCmd>& cmd, DWORD priority, bool messageLoop);
    void QueueSyncCmd(CVKAsyncCmd& cmd, DWORD priority, bool messageLoop);
    void SendCmd(CVKAsyncCmd& cmd);
    void SendCmd(CVKAsyncCmd& cmd, bool messageLoop);
    void SendCmdMsgLoop(CVKAsyncCmd& cmd);
    // Resets the caller's event and returns at once; the event is set when
    // the command has run, failed or been cancelled.
    void SendCmd(CVKAsyncCmd& cmd, void* event);

    DWORD AddQueueLock();
    // 0 without a lock; the release of the last lock restarts processing.
    DWORD ReleaseQueueLock();
    bool IsQueueLocked() const { return m_nQueueLocks.load() > 0; }

    // The counter, read without the lock; Calc... count under the lock.
    DWORD GetQueueSize() const { return m_nQueuedCmds.load(); }
    bool IsQueueEmpty() const { return GetQueueSize() == 0; }
    DWORD CalcQueueSize() const;
    bool CalcIsQueueEmpty() const;
    DWORD GetQueueSize(DWORD priority) const;
    DWORD GetPriorities() const;

    // Processing steps on the calling thread: one, or until nothing runnable is left.
    void ProcessQueue();
    void ProcessEntireQueue();
    // On the queue's thread runs the whole queue; elsewhere waits until the
    // commands queued so far have run.
    void WaitUntilQueueIsEmpty();

    // Every pending command (of one level) is told Canceled() on this thread.
    void EmptyQueue(DWORD priority);
    void EmptyQueue();

    using CVKMsgWnd::GetWndHandle;

protected:
    typedef std::deque<old_auto_ptr<CVKAsyncCmd>> Level;

    bool ProcessSingleQueueCmd();
    void PostQueueProcessMessage();
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override;
    static void ClearQueue(Level& level);
    // Destroys the window only.
    void DestroyQueueWindow() { CVKMsgWnd::Destroy(); }
    bool QueueWindowExists() const { return CVKMsgWnd::Created(); }
    bool IsQueueThread() const { return CVKMsgWnd::IsInThreadCtx(); }

private:
    DWORD LevelOf(DWORD priority) const;
    void WaitForSent(CVKAsyncCmd& wrapper, HANDLE done, DWORD priority, bool messageLoop);

    mutable CRITICAL_SECTION m_lock;
    const DWORD m_nPriorities;
    std::vector<Level> m_levels;
    std::atomic<DWORD> m_nQueuedCmds{0};
    std::atomic<LONG> m_nQueueLocks{0};
    std::atomic<LONG> m_nProcessMessagePending{0};
    CString m_strQueueName;
    // Shared with every running processing step, so that a step can tell
    // whether the queue outlived the command it ran.
    int* m_pLiveness;
};

// A framework worker thread that owns one command queue: it creates the
// queue's window when it starts and runs its commands in its message loop.
// Create returns once the thread is ready; Destroy can let pending commands
// run first, then cancels the rest, stops the thread and waits for its end.
// The thread handle stays valid until the object is destroyed, which closes it.
class VASKEL_API CVKAsyncCmdQueueThread : public CWinThread, public CVKAsyncCmdQueue {
public:
    explicit CVKAsyncCmdQueueThread(DWORD priorities = 1);
    // Does not stop a running thread: Destroy or DestroyThread comes first.
    ~CVKAsyncCmdQueueThread() override;

    // A suspended start is refused: the call waits for the thread's start-up.
    bool Create(DWORD createFlags = 0, UINT stackSize = 0,
                LPSECURITY_ATTRIBUTES attributes = nullptr);
    void Destroy(bool cancelPending);
    // For a heap object: it deletes itself when its thread ends, or at once
    // when no thread runs.
    static void DestroyThread(CVKAsyncCmdQueueThread* thread, bool cancelPending);

    bool Created() const { return m_hThread != nullptr; }
    bool IsAlive() const;
    bool IsInThreadCtx() const;
    void SetQueueName(const CString& name);

    int InitInstance() override;
    int ExitInstance() override;
    int OnIdle(LONG count) override;

private:
    CWnd m_placeholderWnd;
    // The handle of a thread that has ended, kept open for the waits on it.
    HANDLE m_hEndedThread = nullptr;
    bool m_bComInitialized = false;
};

} // namespace vaskel
