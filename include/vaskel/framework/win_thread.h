// CWinThread: the framework's thread. CreateThread starts it; on the new
// thread InitInstance runs, then the message loop until WM_QUIT (calling
// OnIdle while the queue is empty), then ExitInstance. With the auto-delete
// flag set the object deletes itself when the thread ends.
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/wnd.h>
#include <vaskel/win32.h>

namespace vaskel {

class VASKEL_API CWinThread {
public:
    CWinThread();
    CWinThread(const CWinThread&) = delete;
    CWinThread& operator=(const CWinThread&) = delete;
    // Closes the thread handle, when one is still recorded.
    virtual ~CWinThread();

    // Starts the thread; with CREATE_SUSPENDED it waits for ResumeThread.
    bool CreateThread(DWORD createFlags = 0, UINT stackSize = 0,
                      LPSECURITY_ATTRIBUTES securityAttributes = nullptr);
    DWORD ResumeThread();

    // On the new thread. A false answer ends the thread after ExitInstance.
    virtual int InitInstance();
    // The message loop; returns ExitInstance's answer when WM_QUIT arrives.
    virtual int Run();
    // Idle-time work while the queue is empty; true asks for more calls.
    virtual int OnIdle(LONG count);
    // Last call on the thread; the default answers WM_QUIT's exit code.
    virtual int ExitInstance();
    // Deletes the object when the auto-delete flag is set.
    virtual void Delete();

    HANDLE m_hThread;
    DWORD m_nThreadID;
    bool m_bAutoDelete;
    CWnd* m_pMainWnd;

protected:
    // The message that Run took last.
    MSG m_msgCur;

private:
    static DWORD WINAPI ThreadEntry(LPVOID parameter);
};

} // namespace vaskel
