// Thread identity and the per-thread last-error value.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

TEST(ThreadIdentityTest, IdsAndLastErrorBelongToTheirThread) {
    // Turns go through an atomic alone: on Windows other calls may set the last error.
    std::atomic<int> step{0};
    DWORD seenByThread = 0, threadId = 0;
    std::thread other([&] {
        while (step != 1)
            std::this_thread::yield();
        SetLastError(ERROR_ACCESS_DENIED);
        seenByThread = GetLastError();
        threadId = GetCurrentThreadId();
        step = 2;
    });
    SetLastError(ERROR_INVALID_HANDLE);
    step = 1;
    while (step != 2)
        std::this_thread::yield();
    const DWORD seenByMain = GetLastError(); // after the other thread set its own
    other.join();
    EXPECT_EQ(seenByMain, ERROR_INVALID_HANDLE);
    EXPECT_EQ(seenByThread, ERROR_ACCESS_DENIED);
    EXPECT_NE(threadId, GetCurrentThreadId()); // this thread was alive all along
}
