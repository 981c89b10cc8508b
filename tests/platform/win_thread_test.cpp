#include <vaskel/framework/win_thread.h>

#include <gtest/gtest.h>

#include <atomic>

using vaskel::CWinThread;

namespace {

struct Recorder : CWinThread {
    explicit Recorder(bool start = true) : start(start) { m_bAutoDelete = false; }
    int InitInstance() override {
        initThread = GetCurrentThreadId();
        MSG msg;
        PeekMessageA(&msg, nullptr, 0, 0, PM_NOREMOVE); // make the queue
        SetEvent(ready);
        return start;
    }
    int OnIdle(LONG count) override {
        idleCalls += 1;
        if (count == 2)
            SetEvent(idled);
        return count < 2; // asks for three calls, then waits for messages
    }
    int ExitInstance() override {
        exitThread = GetCurrentThreadId();
        return CWinThread::ExitInstance();
    }
    bool start;
    HANDLE ready = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    HANDLE idled = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    std::atomic<DWORD> initThread{0}, exitThread{0};
    std::atomic<int> idleCalls{0};
};

DWORD ExitCodeAfterEnd(HANDLE thread) {
    EXPECT_EQ(WaitForSingleObject(thread, 10000), WAIT_OBJECT_0);
    DWORD code = 0;
    GetExitCodeThread(thread, &code);
    return code;
}

} // namespace

TEST(CWinThreadTest, RunsItsLoopOnTheNewThreadUntilQuit) {
    Recorder thread;
    ASSERT_TRUE(thread.CreateThread());
    EXPECT_NE(thread.m_hThread, nullptr);
    ASSERT_EQ(WaitForSingleObject(thread.ready, 10000), WAIT_OBJECT_0);
    EXPECT_EQ(thread.initThread, thread.m_nThreadID);
    EXPECT_NE(thread.m_nThreadID, GetCurrentThreadId());
    ASSERT_EQ(WaitForSingleObject(thread.idled, 10000), WAIT_OBJECT_0) << "idle with no message";
    PostThreadMessageA(thread.m_nThreadID, WM_QUIT, 5, 0);
    EXPECT_EQ(ExitCodeAfterEnd(thread.m_hThread), 5u) << "ExitInstance answers the quit code";
    EXPECT_EQ(thread.exitThread, thread.m_nThreadID);
    EXPECT_EQ(thread.idleCalls, 3) << "a false answer stops the calls until a message comes";
    CloseHandle(thread.ready);
    CloseHandle(thread.idled);
}

TEST(CWinThreadTest, AFailedStartEndsTheThreadThroughExitInstance) {
    Recorder thread(false);
    ASSERT_TRUE(thread.CreateThread());
    EXPECT_EQ(ExitCodeAfterEnd(thread.m_hThread), 0u);
    EXPECT_EQ(thread.exitThread, thread.m_nThreadID);
    EXPECT_EQ(thread.idleCalls, 0) << "no message loop ran";
    CloseHandle(thread.ready);
}

TEST(CWinThreadTest, ASuspendedStartWaitsForResume) {
    Recorder thread;
    ASSERT_TRUE(thread.CreateThread(CREATE_SUSPENDED));
    EXPECT_EQ(WaitForSingleObject(thread.ready, 50), WAIT_TIMEOUT);
    EXPECT_EQ(thread.ResumeThread(), 1u);
    ASSERT_EQ(WaitForSingleObject(thread.ready, 10000), WAIT_OBJECT_0);
    PostThreadMessageA(thread.m_nThreadID, WM_QUIT, 0, 0);
    ExitCodeAfterEnd(thread.m_hThread);
    CloseHandle(thread.ready);
}

TEST(CWinThreadTest, AnAutoDeletingThreadDeletesItselfAtTheEnd) {
    static std::atomic<bool> deleted{false};
    struct SelfDeleting : CWinThread {
        ~SelfDeleting() override { deleted = true; }
        int InitInstance() override { return 0; }
    };
    auto* thread = new SelfDeleting;
    ASSERT_TRUE(thread->CreateThread(CREATE_SUSPENDED));
    // The object closes its own handle when it goes: wait on a duplicate.
    HANDLE copy = nullptr;
    ASSERT_TRUE(DuplicateHandle(GetCurrentProcess(), thread->m_hThread, GetCurrentProcess(),
                                &copy, 0, FALSE, DUPLICATE_SAME_ACCESS));
    thread->ResumeThread();
    ExitCodeAfterEnd(copy);
    EXPECT_TRUE(deleted);
    CloseHandle(copy);
}
