#include <vaskel/framework/exceptions.h>
#include <vaskel/queue.h>
#include <vaskel/sync.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <thread>
#include <vector>

using namespace vaskel;

namespace {

const UINT kNotify = WM_USER + 1;

struct CountingWnd : CVKMsgWnd {
    CountingWnd() { Create(); }
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override {
        if (message != kNotify)
            return CVKMsgWnd::OnWndMsg(message, wParam, lParam, result);
        ++notified;
        return true;
    }
    int notified = 0;
};

} // namespace

TEST(EventsViaHandles, RegistersEachWindowOnceAndFreesDeadWindowsWhenFull) {
    HWND slots[2] = {};
    EventsViaHandles table(slots, 2);
    const HWND fake = reinterpret_cast<HWND>(0x1000); // no window: stored all the same
    EXPECT_FALSE(table.RegisterHandle(nullptr));
    EXPECT_TRUE(table.RegisterHandle(fake));
    EXPECT_TRUE(table.RegisterHandle(fake));
    EXPECT_EQ(slots[1], nullptr) << "a second registration takes no slot";
    EXPECT_TRUE(table.UnregisterHandle(fake));
    EXPECT_FALSE(table.UnregisterHandle(fake));
    EXPECT_FALSE(table.HandleIsRegistered(fake));

    CountingWnd first, second, newcomer;
    EXPECT_TRUE(table.RegisterHandle(first.GetWndHandle()));
    EXPECT_TRUE(table.RegisterHandle(second.GetWndHandle()));
    EXPECT_FALSE(table.FreeInvalideHandles()) << "every slot holds a live window";
    EXPECT_THROW(table.RegisterHandle(newcomer.GetWndHandle()), CInvalidArgException);
    EXPECT_EQ(slots[0], first.GetWndHandle()) << "unchanged";
    EXPECT_EQ(slots[1], second.GetWndHandle());
    first.Destroy();
    second.Destroy();
    EXPECT_TRUE(table.RegisterHandle(newcomer.GetWndHandle()));
    EXPECT_EQ(slots[0], newcomer.GetWndHandle());
    EXPECT_EQ(slots[1], nullptr) << "dead windows are cleared";
    EXPECT_TRUE(table.FreeInvalideHandles()) << "a free slot counts";

    EventsViaHandles none(nullptr, 5);
    EXPECT_EQ(none.MaxHandleCount(), 0u) << "a null array has no slots";
    EXPECT_THROW(none.RegisterHandle(fake), CInvalidArgException);
}

TEST(EventsViaHandles, NotifiesRegisteredWindowsInSlotOrder) {
    CountingWnd windows[3];
    HWND slots[4] = {windows[0].GetWndHandle(), windows[1].GetWndHandle(), nullptr,
                     windows[2].GetWndHandle()};
    EventsViaHandles table(slots, 4);
    auto counts = [&] {
        MSG msg;
        while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
            DispatchMessageA(&msg);
        return std::vector<int>{windows[0].notified, windows[1].notified, windows[2].notified};
    };
    table.SendMessageToClients(kNotify, 0, 0);
    EXPECT_EQ(counts(), (std::vector<int>{1, 1, 1}));
    table.PosMessageToClients(kNotify, 0, 0);
    EXPECT_EQ(counts(), (std::vector<int>{2, 2, 2}));
    table.PosMessageToClientsExcluding(slots[1], kNotify, 0, 0);
    EXPECT_EQ(counts(), (std::vector<int>{3, 2, 3}));
    table.PosMessageToAnyExcluding(slots[0], kNotify, 0, 0);
    EXPECT_EQ(counts(), (std::vector<int>{3, 3, 3})) << "only the first other window";
    table.SendMessageToAnyExcluding(slots[0], kNotify, 0, 0);
    EXPECT_EQ(counts(), (std::vector<int>{3, 4, 3}));
}

TEST(EventsViaHandles, ConcurrentRegistrationsTakeDistinctSlots) {
    HWND slots[16] = {};
    EventsViaHandles table(slots, 16);
    auto registerEight = [&table](UINT_PTR base) {
        for (UINT_PTR i = 0; i < 8; ++i)
            table.RegisterHandle(reinterpret_cast<HWND>(base + i * 16));
    };
    std::thread other(registerEight, 0x10000);
    registerEight(0x20000);
    other.join();
    std::vector<HWND> held(slots, slots + 16);
    std::sort(held.begin(), held.end());
    EXPECT_NE(held.front(), nullptr) << "every slot is taken";
    EXPECT_EQ(std::unique(held.begin(), held.end()), held.end());
}
