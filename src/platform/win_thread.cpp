#include <vaskel/framework/win_thread.h>

namespace vaskel {

CWnd::~CWnd() = default;

CWinThread::CWinThread()
    : m_hThread(nullptr), m_nThreadID(0), m_bAutoDelete(true), m_pMainWnd(nullptr),
      m_msgCur() {}

CWinThread::~CWinThread() {
    if (m_hThread)
        CloseHandle(m_hThread);
}

bool CWinThread::CreateThread(DWORD createFlags, UINT stackSize,
                              LPSECURITY_ATTRIBUTES securityAttributes) {
    // Started suspended, so that the handle and identifier are recorded
    // before the thread can look at them.
    DWORD id = 0;
    HANDLE thread = ::CreateThread(securityAttributes, stackSize, ThreadEntry, this,
                                   createFlags | CREATE_SUSPENDED, &id);
    if (thread == nullptr)
        return false;
    m_hThread = thread;
    m_nThreadID = id;
    if (!(createFlags & CREATE_SUSPENDED))
        ::ResumeThread(thread);
    return true;
}

DWORD CWinThread::ResumeThread() { return ::ResumeThread(m_hThread); }

int CWinThread::InitInstance() { return 0; }

int CWinThread::Run() {
    bool idle = true;
    LONG idleCount = 0;
    for (;;) {
        while (idle && !PeekMessageA(&m_msgCur, nullptr, 0, 0, PM_NOREMOVE)) {
            if (!OnIdle(idleCount++))
                idle = false;
        }
        do {
            BOOL got = GetMessageA(&m_msgCur, nullptr, 0, 0);
            if (got == 0 || got == -1)
                return ExitInstance();
            TranslateMessage(&m_msgCur);
            DispatchMessageA(&m_msgCur);
            idle = true;
            idleCount = 0;
        } while (PeekMessageA(&m_msgCur, nullptr, 0, 0, PM_NOREMOVE));
    }
}

int CWinThread::OnIdle(LONG /*count*/) { return 0; }

int CWinThread::ExitInstance() { return static_cast<int>(m_msgCur.wParam); }

void CWinThread::Delete() {
    if (m_bAutoDelete)
        delete this;
}

DWORD WINAPI CWinThread::ThreadEntry(LPVOID parameter) {
    auto* thread = static_cast<CWinThread*>(parameter);
    int code = thread->InitInstance() ? thread->Run() : thread->ExitInstance();
    thread->Delete();
    return static_cast<DWORD>(code);
}

} // namespace vaskel
