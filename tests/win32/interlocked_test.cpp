// The Interlocked family: which value each function returns, wrap-around at
// the limits of the type, and atomicity under contention.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <limits>
#include <thread>
#include <vector>

namespace {

TEST(InterlockedTest, IncrementAndDecrementReturnTheNewValue) {
    LONG volatile value = 5;
    EXPECT_EQ(InterlockedIncrement(&value), 6);
    EXPECT_EQ(value, 6);
    EXPECT_EQ(InterlockedDecrement(&value), 5);
    EXPECT_EQ(InterlockedDecrement(&value), 4);
    EXPECT_EQ(value, 4);

    value = 0;
    EXPECT_EQ(InterlockedDecrement(&value), -1);
    EXPECT_EQ(InterlockedIncrement(&value), 0);
}

TEST(InterlockedTest, ExchangeFunctionsReturnTheOldValue) {
    LONG volatile value = 10;
    EXPECT_EQ(InterlockedExchange(&value, 42), 10);
    EXPECT_EQ(value, 42);
    EXPECT_EQ(InterlockedExchangeAdd(&value, 8), 42);
    EXPECT_EQ(value, 50);
    EXPECT_EQ(InterlockedExchangeAdd(&value, -60), 50);
    EXPECT_EQ(value, -10);
}

TEST(InterlockedTest, CompareExchangeSwapsOnlyOnAMatch) {
    LONG volatile value = 7;
    EXPECT_EQ(InterlockedCompareExchange(&value, 9, 8), 7); // no match
    EXPECT_EQ(value, 7);
    EXPECT_EQ(InterlockedCompareExchange(&value, 9, 7), 7); // match
    EXPECT_EQ(value, 9);
}

TEST(InterlockedTest, BitwiseOperationsReturnTheOldValue) {
    LONG volatile value = 0x0F0F;
    EXPECT_EQ(InterlockedAnd(&value, 0x00FF), 0x0F0F);
    EXPECT_EQ(value, 0x000F);
    EXPECT_EQ(InterlockedOr(&value, 0x0F00), 0x000F);
    EXPECT_EQ(value, 0x0F0F);
    EXPECT_EQ(InterlockedXor(&value, 0x0FF0), 0x0F0F);
    EXPECT_EQ(value, 0x00FF);
}

TEST(InterlockedTest, ArithmeticWrapsAtTheLimits) {
    const LONG max = std::numeric_limits<LONG>::max();
    const LONG min = std::numeric_limits<LONG>::min();
    LONG volatile value = max;
    EXPECT_EQ(InterlockedIncrement(&value), min);
    EXPECT_EQ(InterlockedDecrement(&value), max);
    EXPECT_EQ(InterlockedExchangeAdd(&value, 2), max);
    EXPECT_EQ(value, min + 1);

    LONGLONG volatile wide = std::numeric_limits<LONGLONG>::max();
    EXPECT_EQ(InterlockedIncrement64(&wide), std::numeric_limits<LONGLONG>::min());
    EXPECT_EQ(InterlockedDecrement64(&wide), std::numeric_limits<LONGLONG>::max());
}

TEST(InterlockedTest, SixtyFourBitVariantsUseAllBits) {
    const LONGLONG big = 0x100000000LL; // past 32 bits
    LONGLONG volatile value = big - 1;
    EXPECT_EQ(InterlockedIncrement64(&value), big);
    EXPECT_EQ(InterlockedDecrement64(&value), big - 1);
    EXPECT_EQ(InterlockedExchange64(&value, 3 * big), big - 1);
    EXPECT_EQ(InterlockedExchangeAdd64(&value, big), 3 * big);
    EXPECT_EQ(value, 4 * big);
    EXPECT_EQ(InterlockedCompareExchange64(&value, 1, 4 * big + 1), 4 * big);
    EXPECT_EQ(value, 4 * big);
    EXPECT_EQ(InterlockedCompareExchange64(&value, 1, 4 * big), 4 * big);
    EXPECT_EQ(value, 1);
}

TEST(InterlockedTest, PointerVariantsReturnTheOldPointer) {
    int first = 0;
    int second = 0;
    PVOID volatile target = &first;
    EXPECT_EQ(InterlockedExchangePointer(&target, &second), &first);
    EXPECT_EQ(target, &second);
    EXPECT_EQ(InterlockedCompareExchangePointer(&target, nullptr, &first), &second);
    EXPECT_EQ(target, &second);
    EXPECT_EQ(InterlockedCompareExchangePointer(&target, nullptr, &second), &second);
    EXPECT_EQ(target, nullptr);
}

TEST(InterlockedTest, ConcurrentUpdatesAreNotLost) {
    const int threads = 4;
    const int rounds = 20000;
    LONG volatile counter = 0;
    LONG volatile balance = 0;
    LONGLONG volatile total = 0;
    std::vector<std::thread> workers;
    for (int t = 0; t < threads; ++t) {
        workers.emplace_back([&] {
            for (int i = 0; i < rounds; ++i) {
                InterlockedIncrement(&counter);
                InterlockedExchangeAdd(&balance, 3);
                InterlockedDecrement(&balance);
                InterlockedExchangeAdd64(&total, 0x100000000LL);
            }
        });
    }
    for (std::thread& worker : workers)
        worker.join();
    EXPECT_EQ(counter, threads * rounds);
    EXPECT_EQ(balance, 2 * threads * rounds);
    EXPECT_EQ(total, 0x100000000LL * threads * rounds);
}

TEST(InterlockedTest, CompareExchangeLoopsComposeAtomically) {
    // A maximum kept with the usual compare-exchange retry loop.
    const int threads = 4;
    const int rounds = 5000;
    LONG volatile maximum = 0;
    std::vector<std::thread> workers;
    for (int t = 0; t < threads; ++t) {
        workers.emplace_back([&maximum, t] {
            for (int i = 0; i < rounds; ++i) {
                LONG candidate = i * threads + t;
                LONG seen = maximum;
                while (seen < candidate) {
                    LONG previous = InterlockedCompareExchange(&maximum, candidate, seen);
                    if (previous == seen)
                        break;
                    seen = previous;
                }
            }
        });
    }
    for (std::thread& worker : workers)
        worker.join();
    EXPECT_EQ(maximum, (rounds - 1) * threads + (threads - 1));
}

} // namespace
