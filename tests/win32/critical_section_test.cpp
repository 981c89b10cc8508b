// Critical sections: recursive, exclusive, with the owner's thread
// identifier in OwningThread.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace {

DWORD Owner(CRITICAL_SECTION& section) {
    return static_cast<DWORD>(reinterpret_cast<ULONG_PTR>(
        InterlockedCompareExchangePointer(&section.OwningThread, nullptr, nullptr)));
}

} // namespace

TEST(CriticalSectionTest, IsRecursiveAndRecordsItsOwner) {
    CRITICAL_SECTION section;
    InitializeCriticalSection(&section);
    EXPECT_EQ(Owner(section), 0u);
    EnterCriticalSection(&section);
    EXPECT_TRUE(TryEnterCriticalSection(&section));
    EnterCriticalSection(&section);
    EXPECT_EQ(Owner(section), GetCurrentThreadId());

    std::thread other([&] {
        EXPECT_FALSE(TryEnterCriticalSection(&section));
        EXPECT_NE(Owner(section), GetCurrentThreadId());
    });
    other.join();

    LeaveCriticalSection(&section);
    LeaveCriticalSection(&section);
    EXPECT_EQ(Owner(section), GetCurrentThreadId()) << "held until the last leave";
    LeaveCriticalSection(&section);
    EXPECT_EQ(Owner(section), 0u);

    std::thread taker([&] {
        EXPECT_TRUE(TryEnterCriticalSection(&section));
        LeaveCriticalSection(&section);
    });
    taker.join();
    DeleteCriticalSection(&section);
}

TEST(CriticalSectionTest, ExcludesOtherThreads) {
    CRITICAL_SECTION section;
    InitializeCriticalSection(&section);
    long counter = 0; // deliberately not atomic: the section protects it
    const int perThread = 20000;
    std::thread threads[4];
    for (auto& thread : threads)
        thread = std::thread([&] {
            for (int i = 0; i < perThread; ++i) {
                EnterCriticalSection(&section);
                ++counter;
                LeaveCriticalSection(&section);
            }
        });
    for (auto& thread : threads)
        thread.join();
    EXPECT_EQ(counter, 4L * perThread);
    DeleteCriticalSection(&section);
}
