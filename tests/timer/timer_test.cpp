#include <vaskel/timer.h>

#include <gtest/gtest.h>

using namespace vaskel;

TEST(CVKTimer, AnUnstartedTimerHasItsWholeTimeout) {
    const struct {
        DWORD timeout;
        ETimeUnit unit, asked;
        DWORD remaining;
    } cases[] = {
        {2000, tuMilliseconds, tuMilliseconds, 2000},
        {2, tuSeconds, tuMilliseconds, 2000}, // whole seconds are whole ticks
        {3, tuSeconds, tuNanoseconds, 3000000000u},
        {5, tuSeconds, tuNanoseconds, 0xFFFFFFFF}, // saturates beyond 32 bits
        {1500, tuMilliseconds, tuSeconds, 1},
        {0, tuMicroseconds, tuMicroseconds, 0},
    };
    for (const auto& c : cases) {
        CVKTimer timer(c.timeout, c.unit);
        EXPECT_EQ(timer.GetRemainingTime(c.asked), c.remaining) << c.timeout << " in " << c.unit;
        EXPECT_EQ(timer.TimeoutExpired(), c.timeout == 0);
        timer.Start(true);
        EXPECT_EQ(timer.TimeoutExpired(), c.timeout == 0) << "a time-out of 0 expires at once";
    }
    EXPECT_TRUE(CVKTimer().TimeoutExpired()) << "the default time-out is 0";
}

TEST(CVKTimer, CountsDownAndExpiresNotBeforeItsTime) {
    CVKQuickStopWatch since; // started first: it reads at least the timer's time
    CVKTimer timer(100, tuMilliseconds);
    ASSERT_TRUE(timer.Start(false));
    DWORD previous = 100;
    for (int i = 0; i < 2000 && !timer.TimeoutExpired(); ++i) {
        const DWORD remaining = timer.GetRemainingTime(tuMilliseconds);
        ASSERT_LE(remaining, previous);
        previous = remaining;
        Sleep(1);
    }
    EXPECT_TRUE(timer.TimeoutExpired());
    EXPECT_GE(since.GetReading(tuMilliseconds), 100.0);
    EXPECT_EQ(timer.GetRemainingTime(tuNanoseconds), 0u);
}

TEST(CVKTimer, StoppingKeepsTheRemainderAndStartResumesIt) {
    CVKTimer timer(10000, tuMilliseconds);
    timer.Start(true);
    Sleep(20);
    ASSERT_TRUE(timer.Stop());
    const DWORD stopped = timer.GetRemainingTime(tuMilliseconds);
    EXPECT_LE(stopped, 10000u - 19);
    Sleep(20);
    EXPECT_EQ(timer.GetRemainingTime(tuMilliseconds), stopped);

    ASSERT_TRUE(timer.Start(false));
    Sleep(20);
    EXPECT_LE(timer.GetRemainingTime(tuMilliseconds), stopped - 19) << "resumed, not restarted";

    // A restart gives the whole time-out again, less what passed since.
    for (bool byReStart : {false, true}) {
        CVKQuickStopWatch since;
        ASSERT_TRUE(byReStart ? timer.ReStart() : timer.Start(true));
        const DWORD remaining = timer.GetRemainingTime(tuMilliseconds);
        EXPECT_GE(remaining, 10000.0 - since.GetReading(tuMilliseconds));
    }

    // A new time-out applies to the running watch; it counts down in whole
    // units of the timer's own unit.
    Sleep(20);
    timer.SetTimeout(10, tuMilliseconds);
    EXPECT_TRUE(timer.TimeoutExpired());
    timer.SetTimeout(3, tuSeconds);
    const DWORD remaining = timer.GetRemainingTime(tuMilliseconds);
    EXPECT_GT(remaining, 0u);
    EXPECT_EQ(remaining % 1000, 0u);
}
