#include <vaskel/timer.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <functional>
#include <memory>
#include <vector>

using namespace vaskel;

namespace {

const int kSafetyNetMs = 30000; // only a delivery that has gone wrong gets near it
const double kMillisecond = 1.0 / 86400000.0;

// Exposes the building blocks and counts the expiry messages it handles, so
// that a test can tell which deliveries shared one dispatch.
class ProbeController : public CTimerController {
public:
    using CTimerController::DoInternalTimerLogic;
    using CTimerController::GetBaseTick;
    using CTimerController::GetInternalTimerId;
    using CTimerController::GetNextItemUpdateTime;
    using CTimerController::GetNextUpdateTime;
    using CTimerController::RebaseTimerController;
    using CTimerController::SetFirstUpdateTime;
    using CTimerController::SetNextUpdateTime;
    using CTimerController::SetTimer;

    bool Expire(WPARAM timerId) {
        LRESULT result = -1;
        return OnWndMsg(TimerExpiredMessage, timerId, 0, &result) && result == 0;
    }
    int dispatches = 0;

protected:
    bool OnWndMsg(UINT message, WPARAM wParam, LPARAM lParam, LRESULT* result) override {
        if (message == TimerExpiredMessage)
            ++dispatches;
        return CTimerController::OnWndMsg(message, wParam, lParam, result);
    }
};

struct Delivery {
    DWORD eventId;
    int dispatch; // the controller's expiry count when it was delivered
    DWORD tick;   // timeGetTime() at delivery
};

// Records every delivery; an optional action runs inside the call.
class Recorder : public ITimerEvents {
public:
    explicit Recorder(ProbeController* controller = nullptr) : m_controller(controller) {}
    void OnTimeElapsed(DWORD eventId) override {
        deliveries.push_back({eventId, m_controller ? m_controller->dispatches : 0, timeGetTime()});
        if (action)
            action(eventId);
    }
    std::vector<Delivery> deliveries;
    std::function<void(DWORD)> action;

private:
    ProbeController* m_controller;
};

template <class Done>
bool PumpUntil(Done done, int timeoutMs = kSafetyNetMs) {
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
    while (!done()) {
        if (std::chrono::steady_clock::now() > deadline)
            return false;
        MsgWaitForMultipleObjects(0, nullptr, FALSE, 10, QS_ALLINPUT);
        MSG msg;
        while (PeekMessageA(&msg, nullptr, 0, 0, PM_REMOVE))
            DispatchMessageA(&msg);
    }
    return true;
}

void PumpFor(int milliseconds) {
    PumpUntil([] { return false; }, milliseconds);
}

CTimerItem Item(ITimerEvents* target, DWORD eventId, DWORD resolution, double startTime = 0.0) {
    CTimerItem item;
    item.SetTarget(target);
    item.SetEventID(eventId);
    item.SetResolution(resolution);
    item.SetStartTime(CDateTime(startTime));
    return item;
}

#ifndef _WIN32
// Moves the millisecond counter; the POSIX layer's test hook.
class TickOffset {
public:
    explicit TickOffset(DWORD offset) { VkW32SetTickOffset(offset); }
    ~TickOffset() { VkW32SetTickOffset(0); }
    TickOffset(const TickOffset&) = delete;
    TickOffset& operator=(const TickOffset&) = delete;
};
#endif

} // namespace

// The current date-time has whole seconds, so a start on a 1000 ms grid gives
// the same delay whichever second the controller reads.
TEST(TimerControllerSchedule, FirstUpdateKeepsTheStartTimesGrid) {
    ProbeController controller;
    Recorder listener;
    const double now = CDateTime::Now().GetValue();
    struct Case {
        double startOffsetMs;
        DWORD resolution;
        LONGLONG expectedDelay;
    } cases[] = {
        {-2500, 1000, 500}, {-2000, 1000, 1000}, {300, 1000, 300},
        {-2500, 0, 0},      {-1, 7, 6},          {0, 0, 0},
    };
    for (const Case& c : cases) {
        CTimerItem item = Item(&listener, 1, c.resolution, now + c.startOffsetMs * kMillisecond);
        controller.SetFirstUpdateTime(item); // no timer set: the base becomes now
        if (c.startOffsetMs >= 0 && c.resolution == 0)
            EXPECT_LE(item.GetNextUpdate(), 0) << "a start reached by now is due at once";
        else
            EXPECT_EQ(item.GetNextUpdate(), c.expectedDelay)
                << "start " << c.startOffsetMs << " ms, period " << c.resolution;
    }
    CTimerItem plain = Item(&listener, 2, 250);
    controller.SetFirstUpdateTime(plain);
    EXPECT_EQ(plain.GetNextUpdate(), 250);

    CTimerItem periodic = Item(&listener, 3, 1000);
    periodic.SetNextUpdate(500);
    controller.SetNextUpdateTime(periodic);
    EXPECT_EQ(periodic.GetNextUpdate(), 1500) << "the period counts from the due time";
}

TEST(TimerControllerSchedule, ATimeOfDayNotLaterThanNowIsTomorrow) {
    CTimerController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener;
    controller.SetTimer(&listener, 1, CTime::Now(), 1000, false);
    DWORD remaining = 0;
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 1, remaining));
    EXPECT_GE(remaining, 86400000u - 2000);
    EXPECT_LE(remaining, 86400000u);

    CTime inAnHour = CTime::Now();
    inAnHour.AddMinutes(60);
    controller.SetTimer(&listener, 2, inAnHour, 1000, false);
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 2, remaining));
    EXPECT_GE(remaining, 3600000u - 2000);
    EXPECT_LE(remaining, 3600000u);

    controller.SetTimerInSeconds(&listener, 3, 5000000, false);
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 3, remaining));
    EXPECT_EQ(remaining > 4294967295u - 2000, true) << "seconds saturate instead of wrapping";
}

TEST(TimerControllerSchedule, SettingTheSameIdentityReplacesTheTimer) {
    CTimerController controller;
    ASSERT_TRUE(controller.Create());
    Recorder a, b;
    controller.SetTimer(&a, 1, 1000, false);
    controller.SetTimer(&a, 1, 600000, true);
    controller.SetTimer(&a, 2, 1000, false);
    controller.SetTimer(&b, 1, 1000, false);
    EXPECT_EQ(controller.GetSize(), 3u);
    DWORD remaining = 0;
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&a, 1, remaining));
    EXPECT_GT(remaining, 500000u) << "the second setting's period counts";

    remaining = 1234;
    EXPECT_FALSE(controller.GetRemainingMilliseconds(&a, 9, remaining));
    EXPECT_EQ(remaining, 1234u) << "an unknown timer leaves the output alone";

    controller.KillTimer(&a, 9); // unknown: nothing happens
    EXPECT_EQ(controller.GetSize(), 3u);
    EXPECT_TRUE(controller.KillTimers(&a));
    EXPECT_FALSE(controller.KillTimers(&a));
    EXPECT_EQ(controller.GetSize(), 1u);
    EXPECT_TRUE(controller.GetRemainingMilliseconds(&b, 1, remaining));
    controller.KillAllTimers();
    EXPECT_TRUE(controller.IsEmpty());
}

TEST(TimerControllerSchedule, OneSystemTimerIsArmedForTheEarliestDueTime) {
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener;
    EXPECT_EQ(controller.GetInternalTimerId(), 0u);
    controller.SetTimer(&listener, 1, 50000, false);
    const UINT first = controller.GetInternalTimerId();
    EXPECT_NE(first, 0u);
    controller.SetTimer(&listener, 2, 90000, false);
    EXPECT_EQ(controller.GetInternalTimerId(), first) << "a later timer leaves the arming alone";
    controller.SetTimer(&listener, 3, 20000, false);
    EXPECT_NE(controller.GetInternalTimerId(), first) << "an earlier timer re-arms";
    EXPECT_EQ(controller.GetNextUpdateTime(), controller.GetNextItemUpdateTime());

    // A superseded expiry and an early one deliver nothing; the early one re-arms.
    const UINT armed = controller.GetInternalTimerId();
    EXPECT_TRUE(controller.Expire(first));
    EXPECT_EQ(controller.GetInternalTimerId(), armed);
    EXPECT_TRUE(controller.Expire(armed));
    EXPECT_NE(controller.GetInternalTimerId(), armed);
    EXPECT_NE(controller.GetInternalTimerId(), 0u);
    EXPECT_TRUE(listener.deliveries.empty());

    controller.KillAllTimers();
    EXPECT_EQ(controller.GetInternalTimerId(), 0u);
}

TEST(TimerControllerDelivery, PeriodicAndOneShotTimersFireOnTimeOnTheWindowsThread) {
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder periodic(&controller), once(&controller);
    const DWORD thread = GetCurrentThreadId();
    DWORD listenerThread = 0;
    once.action = [&](DWORD) { listenerThread = GetCurrentThreadId(); };
    const DWORD setAt = timeGetTime();
    controller.SetTimer(&periodic, 7, 40, false);
    controller.SetTimer(&once, 8, 100, true);
    ASSERT_TRUE(PumpUntil([&] { return periodic.deliveries.size() >= 4 && !once.deliveries.empty(); }));
    EXPECT_EQ(listenerThread, thread);
    ASSERT_EQ(once.deliveries.size(), 1u);
    EXPECT_GE(once.deliveries[0].tick - setAt, 100u) << "never early";
    for (size_t i = 0; i < periodic.deliveries.size(); ++i)
        EXPECT_GE(periodic.deliveries[i].tick - setAt, 40u * (i + 1)) << "delivery " << i;
    EXPECT_EQ(controller.GetSize(), 1u) << "the one-shot timer is gone";
    controller.KillTimer(&periodic, 7);
    const size_t count = periodic.deliveries.size();
    PumpFor(150);
    EXPECT_EQ(periodic.deliveries.size(), count) << "a killed timer stays quiet";
    EXPECT_EQ(controller.GetInternalTimerId(), 0u);
}

TEST(TimerControllerDelivery, EveryDueTimerIsDeliveredInOneDispatchInDueOrder) {
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener(&controller);
    controller.SetTimer(&listener, 3, 60, true);
    controller.SetTimer(&listener, 1, 20, true);
    controller.SetTimer(&listener, 2, 40, true);
    Sleep(200); // all three fall due before the thread looks at its queue
    ASSERT_TRUE(PumpUntil([&] { return listener.deliveries.size() == 3; }));
    EXPECT_EQ(listener.deliveries[0].eventId, 1u);
    EXPECT_EQ(listener.deliveries[1].eventId, 2u);
    EXPECT_EQ(listener.deliveries[2].eventId, 3u);
    EXPECT_EQ(listener.deliveries[0].dispatch, listener.deliveries[2].dispatch);
}

TEST(TimerControllerDelivery, AOneShotTimerIsGoneWhenItsListenerRuns) {
    CTimerController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener;
    bool foundDuringCall = true;
    DWORD remaining = 99;
    listener.action = [&](DWORD id) {
        foundDuringCall = controller.GetRemainingMilliseconds(&listener, id, remaining);
    };
    controller.SetTimer(&listener, 5, 10, true);
    ASSERT_TRUE(PumpUntil([&] { return !listener.deliveries.empty(); }));
    EXPECT_FALSE(foundDuringCall);
    EXPECT_EQ(remaining, 99u);
    EXPECT_TRUE(controller.IsEmpty());
}

TEST(TimerControllerDelivery, AListenerMayDestroyTheController) {
    auto* controller = new ProbeController;
    ASSERT_TRUE(controller->Create());
    Recorder destroyer, later;
    destroyer.action = [&](DWORD) {
        delete controller;
        controller = nullptr;
    };
    controller->SetTimer(&destroyer, 1, 20, false);
    controller->SetTimer(&later, 2, 40, false);
    Sleep(150); // both are due in the same dispatch
    ASSERT_TRUE(PumpUntil([&] { return controller == nullptr; }));
    PumpFor(100);
    EXPECT_EQ(destroyer.deliveries.size(), 1u);
    EXPECT_TRUE(later.deliveries.empty()) << "nothing runs after the controller is gone";
}

TEST(TimerControllerDelivery, ListenersMaySetAndKillTimersDuringTheDispatch) {
    CTimerController controller;
    ASSERT_TRUE(controller.Create());
    Recorder first, second;
    first.action = [&](DWORD) {
        controller.KillTimer(&first, 1);
        controller.SetTimer(&second, 2, 30, true);
    };
    controller.SetTimer(&first, 1, 20, false);
    ASSERT_TRUE(PumpUntil([&] { return !second.deliveries.empty(); }));
    PumpFor(100);
    EXPECT_EQ(first.deliveries.size(), 1u);
    EXPECT_EQ(second.deliveries.size(), 1u);
    EXPECT_TRUE(controller.IsEmpty());
}

TEST(TimerControllerDelivery, ANestedMessageLoopDefersTheOtherTimersUntilItReturns) {
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder slow(&controller), other(&controller);
    int depth = 0, deepest = 0;
    slow.action = [&](DWORD) {
        deepest = std::max(deepest, ++depth);
        PumpFor(200);
        --depth;
    };
    other.action = [&](DWORD) { deepest = std::max(deepest, depth + 1); };
    controller.SetTimer(&slow, 1, 20, true);
    controller.SetTimer(&other, 2, 60, false);
    ASSERT_TRUE(PumpUntil([&] { return other.deliveries.size() >= 2; }));
    EXPECT_EQ(deepest, 1) << "no listener ran inside another's nested loop";
    EXPECT_EQ(slow.deliveries.size(), 1u);
}

// A periodic timer without a period would otherwise stay due for ever and
// keep one dispatch running.
TEST(TimerControllerDelivery, APeriodicTimerWithoutPeriodFiresOncePerDispatch) {
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder busy(&controller), other(&controller);
    // A listener slower than the clock's tick keeps the timer due on return.
    // A runaway dispatch is ended, so that a fault fails the test instead of
    // hanging it.
    busy.action = [&](DWORD) {
        Sleep(5);
        if (busy.deliveries.size() >= 200)
            controller.KillTimer(&busy, 1);
    };
    controller.SetTimer(&busy, 1, 0, false);
    controller.SetTimer(&other, 2, 50, true);
    ASSERT_TRUE(PumpUntil([&] { return busy.deliveries.size() >= 20 && !other.deliveries.empty(); }));
    controller.KillAllTimers();
    EXPECT_LT(busy.deliveries.size(), 200u);
    for (size_t i = 1; i < busy.deliveries.size(); ++i)
        EXPECT_LT(busy.deliveries[i - 1].dispatch, busy.deliveries[i].dispatch) << "delivery " << i;
}

#ifndef _WIN32
TEST(TimerControllerClock, RebasingKeepsEveryAbsoluteDueTime) {
    TickOffset offset(0);
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener;
    controller.SetTimer(&listener, 1, 600000, false);
    controller.SetTimer(&listener, 2, 900000, false);
    const LONGLONG armed = controller.GetNextUpdateTime();
    const LONGLONG earliest = controller.GetNextItemUpdateTime();
    const DWORD base = controller.GetBaseTick();
    VkW32SetTickOffset(100000);
    controller.RebaseTimerController();
    EXPECT_GE(controller.GetBaseTick() - base, 100000u);
    EXPECT_EQ(controller.GetNextUpdateTime(), armed);
    EXPECT_EQ(controller.GetNextItemUpdateTime(), earliest);
    DWORD remaining = 0;
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 1, remaining));
    EXPECT_LE(remaining, 600000u - 100000u);
    EXPECT_GE(remaining, 600000u - 100000u - 5000u);

    // A timer that would reach past 32 bits of the base rebases first.
    VkW32SetTickOffset(200000);
    controller.SetTimer(&listener, 3, 0xFFFFFFF0u, false);
    EXPECT_GE(controller.GetBaseTick() - base, 200000u);
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 2, remaining));
    EXPECT_LE(remaining, 900000u - 200000u);
    EXPECT_GE(remaining, 900000u - 200000u - 5000u);
}

TEST(TimerControllerClock, TimersFireOnTimeWhileTheCounterPassesItsEnd) {
    const DWORD now = timeGetTime();
    TickOffset offset(0xFFFFFFFFu - now - 150); // the counter wraps about 150 ms from here
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder periodic(&controller), once(&controller);
    const DWORD setAt = timeGetTime();
    controller.SetTimer(&periodic, 1, 100, false);
    controller.SetTimer(&once, 2, 400, true);
    ASSERT_TRUE(PumpUntil([&] { return periodic.deliveries.size() >= 5 && !once.deliveries.empty(); }));
    EXPECT_LT(timeGetTime(), setAt) << "the counter has wrapped";
    EXPECT_GE(once.deliveries[0].tick - setAt, 400u);
    for (size_t i = 0; i < periodic.deliveries.size(); ++i)
        EXPECT_GE(periodic.deliveries[i].tick - setAt, 100u * (i + 1)) << "delivery " << i;
}

// The elapsed time is kept modulo 2^32: a timer due further away than that
// must not come 49.7 days late.
TEST(TimerControllerClock, ATimerBeyondTheCountersRangeKeepsItsDueTime) {
    TickOffset offset(0);
    ProbeController controller;
    ASSERT_TRUE(controller.Create());
    Recorder listener;
    const LONGLONG sixtyDays = 60LL * 86400000;
    controller.SetTimer(&listener, 1, CDateTime(CDateTime::Now().GetValue() + 60.0), 0, true);
    DWORD remaining = 0;
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 1, remaining));
    EXPECT_EQ(remaining, 0xFFFFFFFFu) << "more than 32 bits left";
    const DWORD jump = 0x90000000u;
    for (int i = 1; i <= 2; ++i) {
        VkW32SetTickOffset(jump * i); // wraps on the second step
        EXPECT_TRUE(controller.Expire(controller.GetInternalTimerId())) << "an early expiry";
    }
    EXPECT_TRUE(listener.deliveries.empty());
    ASSERT_TRUE(controller.GetRemainingMilliseconds(&listener, 1, remaining));
    const LONGLONG expected = sixtyDays - 2LL * jump;
    EXPECT_LE(remaining, expected + 2000);
    EXPECT_GE(remaining, expected - 5000);
}
#endif
