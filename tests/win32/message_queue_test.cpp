// Message queues: posting, quitting, retrieving, and the wait on new input.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <vector>

namespace {

void EnsureQueue() {
    MSG msg;
    PeekMessageA(&msg, nullptr, 0, 0, PM_NOREMOVE);
}

UINT Next(MSG& msg) {
    EXPECT_TRUE(PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE));
    return msg.message;
}

} // namespace

TEST(MessageQueueTest, PostedMessagesComeInOrderAndAQuitFlagWaitsForThem) {
    EnsureQueue();
    DWORD self = GetCurrentThreadId();
    PostThreadMessageA(self, WM_USER + 1, 10, 20);
    PostQuitMessage(7);
    PostMessageA(nullptr, WM_USER + 2, 0, 0); // a null window posts to the caller
    MSG msg;
    EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER + 1));
    EXPECT_EQ(msg.wParam, 10u);
    EXPECT_EQ(msg.lParam, 20);
    EXPECT_EQ(msg.hwnd, nullptr);
    EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER + 2)) << "the quit flag waits for posted ones";
    EXPECT_FALSE(GetMessageA(&msg, nullptr, 0, 0));
    EXPECT_EQ(msg.message, static_cast<UINT>(WM_QUIT));
    EXPECT_EQ(msg.wParam, 7u);
    EXPECT_FALSE(PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) << "the quit was taken";
}

TEST(MessageQueueTest, APostedQuitKeepsItsPlaceInTheQueue) {
    EnsureQueue();
    DWORD self = GetCurrentThreadId();
    PostThreadMessageA(self, WM_QUIT, 3, 0);
    PostThreadMessageA(self, WM_USER, 0, 0);
    MSG msg;
    EXPECT_TRUE(PeekMessageA(&msg, nullptr, 0, 0, PM_NOREMOVE));
    EXPECT_EQ(msg.message, static_cast<UINT>(WM_QUIT)) << "PM_NOREMOVE leaves it";
    EXPECT_FALSE(GetMessageA(&msg, nullptr, 0, 0));
    EXPECT_EQ(msg.wParam, 3u);
    EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER));
}

TEST(MessageQueueTest, PostingToAThreadWithoutQueueOrThatEndedFails) {
    std::atomic<DWORD> id{0};
    std::thread quiet([&] { id = GetCurrentThreadId(); });
    quiet.join();
    // Wine answers ERROR_INVALID_PARAMETER where Windows documents this code.
    const DWORD expected =
        vaskel_test::RunningOnWine() ? ERROR_INVALID_PARAMETER : ERROR_INVALID_THREAD_ID;
    SetLastError(0);
    EXPECT_FALSE(PostThreadMessageA(id, WM_USER, 0, 0));
    EXPECT_EQ(GetLastError(), expected);

    std::thread withQueue([&] {
        EnsureQueue();
        id = GetCurrentThreadId();
    });
    withQueue.join();
    SetLastError(0);
    EXPECT_FALSE(PostThreadMessageA(id, WM_USER, 0, 0));
    EXPECT_EQ(GetLastError(), expected);
}

TEST(MessageQueueTest, AThreadPostingToItselfGetsAQueue) {
    std::thread fresh([] {
        EXPECT_TRUE(PostThreadMessageA(GetCurrentThreadId(), WM_USER, 0, 0));
        MSG msg;
        EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER));
    });
    fresh.join();
}

TEST(MessageQueueTest, FiltersSelectByNumber) {
    EnsureQueue();
    DWORD self = GetCurrentThreadId();
    PostThreadMessageA(self, WM_USER + 5, 0, 0);
    PostThreadMessageA(self, WM_USER + 1, 0, 0);
    MSG msg;
    EXPECT_TRUE(GetMessageA(&msg, nullptr, WM_USER, WM_USER + 2));
    EXPECT_EQ(msg.message, static_cast<UINT>(WM_USER + 1));
    EXPECT_FALSE(PeekMessageA(&msg, nullptr, WM_USER, WM_USER + 2, PM_REMOVE));
    EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER + 5));
}

TEST(MsgWaitTest, WakesOnNewInputOnlyAndPrefersHandles) {
    EnsureQueue();
    HANDLE events[2] = {CreateEventA(nullptr, TRUE, FALSE, nullptr),
                        CreateEventA(nullptr, TRUE, FALSE, nullptr)};
    EXPECT_EQ(MsgWaitForMultipleObjects(2, events, FALSE, 0, QS_ALLINPUT), WAIT_TIMEOUT);
    PostThreadMessageA(GetCurrentThreadId(), WM_USER, 0, 0);
    EXPECT_EQ(MsgWaitForMultipleObjects(2, events, FALSE, 0, QS_ALLINPUT), WAIT_OBJECT_0 + 2);
    EXPECT_EQ(MsgWaitForMultipleObjects(0, nullptr, FALSE, 0, QS_ALLINPUT), WAIT_OBJECT_0)
        << "the wait itself does not count as looking";
    MSG msg;
    EXPECT_TRUE(PeekMessageA(&msg, nullptr, WM_USER + 1, WM_USER + 1, PM_NOREMOVE) == FALSE);
    EXPECT_EQ(MsgWaitForMultipleObjects(0, nullptr, FALSE, 20, QS_ALLINPUT), WAIT_TIMEOUT)
        << "input already seen and left unread does not wake it";

    SetEvent(events[1]);
    PostThreadMessageA(GetCurrentThreadId(), WM_USER, 0, 0);
    EXPECT_EQ(MsgWaitForMultipleObjects(2, events, FALSE, 0, QS_ALLINPUT), WAIT_OBJECT_0 + 1);

    // Waiting for all takes every handle and new input together.
    PeekMessageA(&msg, nullptr, WM_USER + 1, WM_USER + 1, PM_NOREMOVE);
    SetEvent(events[0]);
    EXPECT_EQ(MsgWaitForMultipleObjects(2, events, TRUE, 20, QS_ALLINPUT), WAIT_TIMEOUT);
    PostThreadMessageA(GetCurrentThreadId(), WM_USER, 0, 0);
    EXPECT_EQ(MsgWaitForMultipleObjects(2, events, TRUE, 0, QS_ALLINPUT), WAIT_OBJECT_0);

    while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
    }
    CloseHandle(events[0]);
    CloseHandle(events[1]);
}

TEST(MsgWaitTest, WakesWhenAnotherThreadPosts) {
    EnsureQueue();
    DWORD self = GetCurrentThreadId();
    std::thread poster([&] {
        Sleep(20);
        PostThreadMessageA(self, WM_USER + 9, 0, 0);
    });
    EXPECT_EQ(MsgWaitForMultipleObjects(0, nullptr, FALSE, 10000, QS_ALLINPUT), WAIT_OBJECT_0);
    poster.join();
    MSG msg;
    EXPECT_EQ(Next(msg), static_cast<UINT>(WM_USER + 9));
}

TEST(RegisterWindowMessageTest, OneNameOneNumberWhateverTheCase) {
    UINT first = RegisterWindowMessageA("vaskel-test-message");
    EXPECT_GE(first, 0xC000u);
    EXPECT_LE(first, 0xFFFFu);
    EXPECT_EQ(RegisterWindowMessageA("VASKEL-Test-Message"), first);
    EXPECT_NE(RegisterWindowMessageA("vaskel-test-other"), first);
    EXPECT_EQ(RegisterWindowMessageA(""), 0u);
}

TEST(MessageQueueTest, ManySendersPostingToOneWindowLoseAndReorderNothing) {
#ifdef _WIN32
    const LPARAM perSender = 25000; // the Windows layer under Wine is far slower
#else
    const LPARAM perSender = 250000;
#endif
    const int senders = 4;
    WNDCLASSEXA info = {};
    info.cbSize = sizeof info;
    info.lpfnWndProc = DefWindowProcA;
    info.lpszClassName = "VaskelStressWindow";
    RegisterClassExA(&info);
    HWND window = CreateWindowExA(0, "VaskelStressWindow", nullptr, WS_CHILD, 0, 0, 0, 0,
                                  HWND_MESSAGE, nullptr, nullptr, nullptr);
    ASSERT_NE(window, nullptr);
    std::vector<std::thread> threads;
    for (int s = 0; s < senders; ++s)
        threads.emplace_back([=] {
            for (LPARAM i = 0; i < perSender; ++i)
                while (!PostMessageA(window, WM_USER, static_cast<WPARAM>(s), i))
                    Sleep(1); // a full queue on Windows: try again
        });
    LPARAM next[senders] = {};
    long long received = 0, misordered = 0;
    MSG msg;
    while (received < senders * perSender && GetMessageA(&msg, window, 0, 0) > 0) {
        if (msg.message != WM_USER)
            continue;
        if (msg.lParam != next[msg.wParam]++)
            ++misordered;
        ++received;
    }
    for (auto& thread : threads)
        thread.join();
    EXPECT_EQ(received, senders * perSender);
    EXPECT_EQ(misordered, 0);
    EXPECT_FALSE(PeekMessageA(&msg, window, 0, 0, PM_REMOVE)) << "nothing arrived twice";
    DestroyWindow(window);
}
