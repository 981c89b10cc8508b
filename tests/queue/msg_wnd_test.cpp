#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <thread>
#include <vector>

using namespace vaskel;

namespace {

const DWORD kSafetyNet = 30000; // ms; only a wait that has gone wrong gets near it
const UINT kPing = WM_USER + 1;

void PumpWaitingMessages() {
    MSG msg;
    while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
        DispatchMessageA(&msg);
}

// Records every message its handler sees; answers kPing with its first
// parameter.
template <class Base>
struct Recording : Base {
    using Base::Base;
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override {
        seen.push_back(message);
        if (message != kPing)
            return Base::OnWndMsg(message, wParam, lParam, result);
        *result = static_cast<LRESULT>(wParam);
        return true;
    }
    std::vector<UINT> seen;
};
using RecordingWnd = Recording<CVKMsgWnd>;
using RecordingNamedWnd = Recording<CVKNamedClassWnd>;

int g_foreignClassCalls = 0;

LRESULT CALLBACK ForeignClassProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    ++g_foreignClassCalls;
    return DefWindowProcA(window, message, wParam, lParam);
}

} // namespace

TEST(CVKMsgWnd, EachWindowGetsOnlyItsOwnMessagesUntilDestroyedOnItsThread) {
    EXPECT_STREQ(CVKMsgWnd::GetMsgWndClassName(), "KXMSGWNDCLASS");
    RecordingWnd a, b;
    EXPECT_FALSE(a.Created());
    ASSERT_TRUE(a.Create());
    const HWND first = a.GetWndHandle();
    EXPECT_TRUE(a.Create());
    EXPECT_EQ(a.GetWndHandle(), first) << "a second Create keeps the window";
    ASSERT_TRUE(b.Create());
    EXPECT_TRUE(a.IsInThreadCtx());
    EXPECT_TRUE(a.seen.empty()) << "creation messages stay with the class procedure";

    EXPECT_TRUE(a.PostMessageA(kPing, 0, 0));
    EXPECT_TRUE(b.PostMessageDebug(WM_USER, 0, 0));
    PumpWaitingMessages();
    EXPECT_EQ(a.seen, std::vector<UINT>{kPing});
    EXPECT_EQ(b.seen, std::vector<UINT>{WM_USER});
    EXPECT_TRUE(a.SendMessageA(kPing, 7, 0));
    EXPECT_FALSE(a.SendMessageA(kPing, 0, 0)) << "the handler stored 0";

    // Destroy, and a destroy request posted to the window.
    const HWND second = b.GetWndHandle();
    a.Destroy();
    b.PostMessageA(WM_APP, 0, 0);
    PumpWaitingMessages();
    for (RecordingWnd* window : {&a, &b}) {
        EXPECT_FALSE(window->Created());
        window->Destroy(); // nothing left to destroy
        EXPECT_EQ(std::count(window->seen.begin(), window->seen.end(), WM_DESTROY), 1);
    }
    EXPECT_FALSE(IsWindow(first) || IsWindow(second));
    auto* scoped = new CVKMsgWnd;
    ASSERT_TRUE(scoped->Create());
    const HWND third = scoped->GetWndHandle();
    delete scoped;
    EXPECT_FALSE(IsWindow(third)) << "the destructor destroys the window";
}

TEST(CVKMsgWnd, ServesOtherThreadsAndIsDestroyedOnItsOwn) {
    CVKEvent created;
    RecordingWnd window, probe;
    std::thread owner([&] {
        window.Create();
        probe.Create();
        created.SetEvent();
        MSG msg;
        while (GetMessageA(&msg, nullptr, 0, 0) > 0)
            DispatchMessageA(&msg);
        probe.Destroy();
    });
    ASSERT_TRUE(created.Lock(kSafetyNet));
    const HWND handle = window.GetWndHandle();
    EXPECT_FALSE(window.IsInThreadCtx());
    EXPECT_TRUE(window.SendMessageA(kPing, 1, 0)) << "answered on the owner's thread";

    window.Destroy();
    EXPECT_FALSE(window.Created()) << "let go of at once";
    // A round trip sent after the destroy request: the request has been handled.
    probe.SendMessageA(kPing, 0, 0);
    EXPECT_FALSE(IsWindow(handle));
    EXPECT_EQ(window.seen, std::vector<UINT>{kPing}) << "no WM_DESTROY either";

    PostThreadMessageA(GetWindowThreadProcessId(probe.GetWndHandle(), nullptr), WM_QUIT, 0, 0);
    owner.join();
}

TEST(CVKNamedClassWnd, UsesAnExistingClassUnchanged) {
    WNDCLASSEXA foreign = {};
    foreign.cbSize = sizeof foreign;
    foreign.lpfnWndProc = ForeignClassProc;
    foreign.lpszClassName = "VaskelTestForeignClass";
    ASSERT_TRUE(RegisterClassExA(&foreign) != 0 || GetLastError() == ERROR_CLASS_ALREADY_EXISTS);
    g_foreignClassCalls = 0;

    RecordingNamedWnd window(CString(foreign.lpszClassName));
    ASSERT_TRUE(window.Create());
    EXPECT_GT(g_foreignClassCalls, 0) << "the class procedure saw the creation messages";
    const int creationCalls = g_foreignClassCalls;
    PostMessageA(window.GetWndHandle(), kPing, 0, 0);
    PumpWaitingMessages();
    EXPECT_EQ(window.seen, std::vector<UINT>{kPing});
    EXPECT_EQ(g_foreignClassCalls, creationCalls);
    window.Destroy();
    EXPECT_EQ(window.seen, (std::vector<UINT>{kPing, WM_DESTROY}));
}

TEST(CVKNamedClassWnd, CrossThreadDestroyIsPostedAndNothingMoreReachesTheObject) {
    CVKEvent created, pump;
    RecordingNamedWnd window{CString("VaskelTestFreshClass")}; // registered by Create
    bool destroyedWhenPumped = false;
    std::thread owner([&] {
        window.Create();
        const HWND handle = window.GetWndHandle();
        created.SetEvent();
        pump.Lock(kSafetyNet);
        PumpWaitingMessages();
        destroyedWhenPumped = !IsWindow(handle);
    });
    ASSERT_TRUE(created.Lock(kSafetyNet));
    const HWND handle = window.GetWndHandle();
    ASSERT_NE(handle, nullptr);
    PostMessageA(handle, kPing, 0, 0); // still queued when the object lets go
    window.Destroy();
    EXPECT_FALSE(window.Created());
    EXPECT_TRUE(IsWindow(handle)) << "the owner has not pumped yet";
    pump.SetEvent();
    owner.join();
    EXPECT_TRUE(destroyedWhenPumped);
    EXPECT_TRUE(window.seen.empty());
}
