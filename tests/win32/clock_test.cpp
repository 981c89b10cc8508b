// The performance counter and the millisecond clocks.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

TEST(ClockTest, ThePerformanceCounterIsMonotonicAndMatchesItsFrequency) {
    LARGE_INTEGER frequency, before, after;
    ASSERT_TRUE(QueryPerformanceFrequency(&frequency));
    EXPECT_GT(frequency.QuadPart, 0);
    ASSERT_TRUE(QueryPerformanceCounter(&before));
    LONGLONG previous = before.QuadPart;
    for (int i = 0; i < 10000; ++i) {
        LARGE_INTEGER now;
        QueryPerformanceCounter(&now);
        ASSERT_GE(now.QuadPart, previous);
        previous = now.QuadPart;
    }
    DWORD tickBefore = GetTickCount(), timeBefore = timeGetTime();
    Sleep(50);
    QueryPerformanceCounter(&after);
    double seconds = double(after.QuadPart - before.QuadPart) / double(frequency.QuadPart);
    EXPECT_GE(seconds, 0.040);
    EXPECT_LT(seconds, 60.0);
    EXPECT_GE(GetTickCount() - tickBefore, 30u);
    EXPECT_GE(timeGetTime() - timeBefore, 30u);
}

#ifndef _WIN32
// The offset hook exists only in the POSIX implementation.
TEST(ClockTest, MillisecondClocksWrapAroundAt32Bits) {
    DWORD now = GetTickCount();
    VkW32SetTickOffset(0xFFFFFFFFu - now - 20);
    DWORD nearEnd = GetTickCount();
    EXPECT_GE(nearEnd, 0xFFFFFFFFu - 100);
    Sleep(60);
    DWORD afterWrap = GetTickCount();
    DWORD mmAfterWrap = timeGetTime();
    VkW32SetTickOffset(0);
    EXPECT_LT(afterWrap, 1000u);
    EXPECT_LT(mmAfterWrap, 1000u);
    EXPECT_GE(static_cast<DWORD>(afterWrap - nearEnd), 50u)
        << "differences stay right across the wrap";
}
#endif
