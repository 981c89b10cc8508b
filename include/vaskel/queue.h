// Commands, the ownership that carries them into and out of queues, and the
// message windows that bring work onto a thread.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

#include <atomic>

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

} // namespace vaskel
