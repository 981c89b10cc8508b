// Window classes, message-only windows, and messages posted and sent to them.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

namespace {

thread_local std::vector<UINT>* seen = nullptr;

LRESULT CALLBACK Recording(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (seen && message != WM_NULL)
        seen->push_back(message);
    if (message == WM_USER)
        return static_cast<LRESULT>(wParam) * 2;
    return DefWindowProcA(window, message, wParam, lParam);
}

const char* ClassName() {
    static ATOM atom = [] {
        WNDCLASSEXA info = {};
        info.cbSize = sizeof info;
        info.style = CS_GLOBALCLASS; // found without naming a module
        info.lpfnWndProc = Recording;
        info.lpszClassName = "VaskelTestWindow";
        return RegisterClassExA(&info);
    }();
    EXPECT_NE(atom, 0);
    return "VaskelTestWindow";
}

HWND NewWindow(LONG_PTR id = 0) {
    return CreateWindowExA(0, ClassName(), nullptr, WS_CHILD, 0, 0, 0, 0, HWND_MESSAGE,
                           reinterpret_cast<HMENU>(id), nullptr, nullptr);
}

void Pump() {
    MSG msg;
    while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE)) {
        TranslateMessage(&msg);
        DispatchMessageA(&msg);
    }
}

} // namespace

TEST(WindowClassTest, RegisteredOnceAndFoundFromAnyThread) {
    ClassName();
    WNDCLASSEXA again = {};
    again.cbSize = sizeof again;
    again.style = CS_GLOBALCLASS;
    again.lpfnWndProc = DefWindowProcA;
    again.lpszClassName = "vaskeltestwindow";
    SetLastError(0);
    EXPECT_EQ(RegisterClassExA(&again), 0) << "class names compare without case";
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_CLASS_ALREADY_EXISTS));
    std::thread other([] {
        WNDCLASSEXA info = {};
        info.cbSize = sizeof info;
        EXPECT_TRUE(GetClassInfoExA(nullptr, "VaskelTestWindow", &info));
        EXPECT_EQ(info.lpfnWndProc, Recording);
        EXPECT_FALSE(GetClassInfoExA(nullptr, "VaskelNoSuchClass", &info));
    });
    other.join();
}

TEST(WindowTest, CreationSendsItsMessagesAndKeepsAPointerSizedIdentifier) {
    std::vector<UINT> messages;
    seen = &messages;
    LONG_PTR id = reinterpret_cast<LONG_PTR>(&messages); // a full pointer survives
    HWND window = NewWindow(id);
    ASSERT_NE(window, nullptr);
    ASSERT_GE(messages.size(), 2u);
    EXPECT_EQ(messages.front(), static_cast<UINT>(WM_NCCREATE));
    EXPECT_NE(std::find(messages.begin(), messages.end(), static_cast<UINT>(WM_CREATE)),
              messages.end());
    EXPECT_EQ(GetWindowLongPtrA(window, GWLP_ID), id);
    EXPECT_TRUE(IsWindow(window));
    DWORD process = 0;
    EXPECT_EQ(GetWindowThreadProcessId(window, &process), GetCurrentThreadId());
    EXPECT_EQ(process, GetCurrentProcessId());

    messages.clear();
    EXPECT_TRUE(DestroyWindow(window));
    ASSERT_GE(messages.size(), 2u);
    EXPECT_EQ(messages[0], static_cast<UINT>(WM_DESTROY));
    EXPECT_EQ(messages.back(), static_cast<UINT>(WM_NCDESTROY));
    EXPECT_FALSE(IsWindow(window));
    seen = nullptr;
}

TEST(WindowTest, ReplacedProceduresAndADeadWindowsMessages) {
    HWND window = NewWindow();
    static WNDPROC original;
    original = reinterpret_cast<WNDPROC>(SetWindowLongPtrA(
        window, GWLP_WNDPROC,
        reinterpret_cast<LONG_PTR>(+[](HWND w, UINT m, WPARAM wp, LPARAM lp) -> LRESULT {
            return m == WM_USER + 1 ? 77 : CallWindowProcA(original, w, m, wp, lp);
        })));
    EXPECT_EQ(original, Recording);
    EXPECT_EQ(SendMessageA(window, WM_USER + 1, 0, 0), 77);
    EXPECT_EQ(SendMessageA(window, WM_USER, 21, 0), 42) << "chained to the class procedure";

    std::vector<UINT> messages;
    seen = &messages;
    PostMessageA(window, WM_USER + 2, 0, 0);
    DestroyWindow(window);
    messages.clear();
    Pump();
    EXPECT_TRUE(messages.empty()) << "a destroyed window's posted messages are dropped";
    SetLastError(0);
    EXPECT_FALSE(PostMessageA(window, WM_USER, 0, 0));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_WINDOW_HANDLE));
    EXPECT_EQ(SendMessageA(window, WM_USER, 1, 0), 0);
    seen = nullptr;
}

TEST(WindowTest, OnlyItsOwnThreadDestroysAWindow) {
    HWND window = NewWindow();
    std::thread other([&] {
        SetLastError(0);
        EXPECT_FALSE(DestroyWindow(window));
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_ACCESS_DENIED));
    });
    other.join();
    EXPECT_TRUE(IsWindow(window));
    DestroyWindow(window);
}

TEST(WindowTest, AThreadsWindowsEndWithIt) {
    HWND window = nullptr;
    std::thread owner([&] { window = NewWindow(); });
    owner.join();
    ASSERT_NE(window, nullptr);
    EXPECT_FALSE(IsWindow(window));
    EXPECT_FALSE(PostMessageA(window, WM_USER, 0, 0));
}

TEST(SendMessageTest, AcrossThreadsTheSenderWaitsForTheOwnersLoop) {
    std::atomic<HWND> window{nullptr};
    std::atomic<bool> stop{false};
    std::thread owner([&] {
        window = NewWindow();
        MSG msg;
        while (!stop && GetMessageA(&msg, nullptr, 0, 0) > 0)
            DispatchMessageA(&msg);
        DestroyWindow(window);
    });
    while (!window)
        Sleep(1);
    EXPECT_EQ(SendMessageA(window, WM_USER, 5, 0), 10);
    DWORD_PTR result = 0;
    EXPECT_TRUE(SendMessageTimeoutA(window, WM_USER, 8, 0, SMTO_NORMAL, 10000, &result));
    EXPECT_EQ(result, 16u);
    stop = true;
    PostMessageA(window, WM_NULL, 0, 0);
    owner.join();
}

TEST(SendMessageTest, TwoThreadsSendingToEachOtherDoNotDeadlock) {
    HWND mine = NewWindow();
    std::atomic<HWND> theirs{nullptr};
    std::atomic<LRESULT> nested{0};
    static HWND replyTo;
    replyTo = mine;
    std::thread other([&] {
        // Its procedure answers WM_USER + 3 by sending back to the first thread.
        HWND window = NewWindow();
        SetWindowLongPtrA(
            window, GWLP_WNDPROC,
            reinterpret_cast<LONG_PTR>(+[](HWND w, UINT m, WPARAM wp, LPARAM lp) -> LRESULT {
                if (m == WM_USER + 3)
                    return SendMessageA(replyTo, WM_USER, wp, 0) + 1;
                return DefWindowProcA(w, m, wp, lp);
            }));
        theirs = window;
        MSG msg;
        while (GetMessageA(&msg, nullptr, 0, 0) > 0)
            DispatchMessageA(&msg);
        DestroyWindow(window);
    });
    while (!theirs)
        Sleep(1);
    // While this thread waits for its send, it runs the send coming back.
    nested = SendMessageA(theirs, WM_USER + 3, 4, 0);
    EXPECT_EQ(nested, 9);
    PostThreadMessageA(GetWindowThreadProcessId(theirs, nullptr), WM_QUIT, 0, 0);
    other.join();
    DestroyWindow(mine);
}

TEST(SendMessageTest, ATimedOutSendReturnsWithTheTimeOutError) {
    std::atomic<HWND> window{nullptr};
    HANDLE go = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    std::atomic<int> handled{0};
    static std::atomic<int>* count;
    count = &handled;
    std::thread owner([&] {
        HWND w = NewWindow();
        SetWindowLongPtrA(
            w, GWLP_WNDPROC,
            reinterpret_cast<LONG_PTR>(+[](HWND h, UINT m, WPARAM wp, LPARAM lp) -> LRESULT {
                if (m == WM_USER + 4)
                    ++*count;
                return DefWindowProcA(h, m, wp, lp);
            }));
        window = w;
        WaitForSingleObject(go, INFINITE); // not pumping meanwhile
        Pump();
        DestroyWindow(w);
    });
    while (!window)
        Sleep(1);
    DWORD_PTR result = 1;
    SetLastError(0);
    EXPECT_FALSE(SendMessageTimeoutA(window, WM_USER + 4, 0, 0, SMTO_NORMAL, 50, &result));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_TIMEOUT));
    SetEvent(go);
    owner.join();
    // Windows leaves the message to be handled later or dropped; never twice.
    EXPECT_LE(handled, 1);
    CloseHandle(go);
}
