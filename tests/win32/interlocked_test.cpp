// The Interlocked family: the value each returns, wrap-around at the limits of
// the type and atomicity. Each result also shows what the call before it left.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <limits>
#include <thread>

TEST(InterlockedTest, LongReturnValuesAndWrapAround) {
    const LONG max = std::numeric_limits<LONG>::max(), min = std::numeric_limits<LONG>::min();
    LONG volatile value = max;
    EXPECT_EQ(InterlockedIncrement(&value), min); // the new value
    EXPECT_EQ(InterlockedDecrement(&value), max);
    EXPECT_EQ(InterlockedExchangeAdd(&value, 2), max); // the old value
    EXPECT_EQ(InterlockedExchange(&value, 0x0F0F), min + 1);
    EXPECT_EQ(InterlockedAnd(&value, 0x00FF), 0x0F0F);
    EXPECT_EQ(InterlockedOr(&value, 0x0F00), 0x000F);
    EXPECT_EQ(InterlockedXor(&value, 0x0FF0), 0x0F0F);
    EXPECT_EQ(InterlockedCompareExchange(&value, 9, 0x00FF), 0x00FF);
    EXPECT_EQ(value, 9);
}

TEST(InterlockedTest, LongLongReturnValuesAndWrapAround) {
    const LONGLONG big = 0x100000000LL; // past 32 bits
    const LONGLONG max = std::numeric_limits<LONGLONG>::max();
    LONGLONG volatile value = big - 1;
    EXPECT_EQ(InterlockedIncrement64(&value), big);
    EXPECT_EQ(InterlockedExchangeAdd64(&value, big), big);
    EXPECT_EQ(InterlockedCompareExchange64(&value, 1, 0), 2 * big); // equal low halves only
    EXPECT_EQ(InterlockedExchange64(&value, max), 2 * big);
    EXPECT_EQ(InterlockedIncrement64(&value), std::numeric_limits<LONGLONG>::min());
    EXPECT_EQ(InterlockedDecrement64(&value), max);
    EXPECT_EQ(InterlockedCompareExchange64(&value, 1, max), max);
    EXPECT_EQ(value, 1);
}

TEST(InterlockedTest, ConcurrentIncrementsAreNotLost) {
    LONG volatile count = 0;
    std::atomic<bool> go{false};
    auto work = [&] {
        while (!go) // so that the threads overlap
            std::this_thread::yield();
        for (int i = 0; i < 1000000; ++i)
            InterlockedIncrement(&count);
    };
    std::thread first(work), second(work);
    go = true;
    first.join();
    second.join();
    EXPECT_EQ(count, 2 * 1000000);
}
