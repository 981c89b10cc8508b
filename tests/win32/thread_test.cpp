// Threads as kernel objects, handle duplication and sleeping.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

namespace {

struct Shared {
    HANDLE go = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    std::atomic<DWORD> seenId{0};
    std::atomic<int> runs{0};
    ~Shared() { CloseHandle(go); }
};

DWORD WINAPI Worker(LPVOID parameter) {
    auto* shared = static_cast<Shared*>(parameter);
    shared->seenId = GetCurrentThreadId();
    ++shared->runs;
    WaitForSingleObject(shared->go, INFINITE);
    return 42;
}

} // namespace

TEST(ThreadTest, HandleIsSignalledWhenTheThreadEndsWithItsExitCode) {
    Shared shared;
    DWORD id = 0;
    HANDLE thread = CreateThread(nullptr, 0, Worker, &shared, 0, &id);
    ASSERT_NE(thread, nullptr);
    EXPECT_NE(id, 0u);
    EXPECT_EQ(GetThreadId(thread), id);
    DWORD code = 0;
    EXPECT_TRUE(GetExitCodeThread(thread, &code));
    EXPECT_EQ(code, static_cast<DWORD>(STILL_ACTIVE));
    EXPECT_EQ(WaitForSingleObject(thread, 0), WAIT_TIMEOUT);

    SetEvent(shared.go);
    EXPECT_EQ(WaitForSingleObject(thread, 10000), WAIT_OBJECT_0);
    EXPECT_EQ(WaitForSingleObject(thread, 0), WAIT_OBJECT_0) << "an ended thread stays signalled";
    EXPECT_EQ(shared.seenId, id);
    EXPECT_TRUE(GetExitCodeThread(thread, &code));
    EXPECT_EQ(code, 42u);
    EXPECT_TRUE(CloseHandle(thread));
}

TEST(ThreadTest, ASuspendedThreadRunsOnlyWhenResumed) {
    Shared shared;
    SetEvent(shared.go);
    HANDLE thread = CreateThread(nullptr, 64 * 1024, Worker, &shared, CREATE_SUSPENDED, nullptr);
    ASSERT_NE(thread, nullptr);
    EXPECT_EQ(WaitForSingleObject(thread, 50), WAIT_TIMEOUT);
    EXPECT_EQ(shared.runs, 0);
    EXPECT_EQ(ResumeThread(thread), 1u);
    EXPECT_EQ(WaitForSingleObject(thread, 10000), WAIT_OBJECT_0);
    EXPECT_EQ(shared.runs, 1);
    EXPECT_EQ(ResumeThread(thread), 0u) << "a running thread is not suspended";
    CloseHandle(thread);
}

TEST(ThreadTest, AThreadHandleReleasesEveryWaiter) {
    Shared shared;
    HANDLE thread = CreateThread(nullptr, 0, Worker, &shared, 0, nullptr);
    std::atomic<int> released{0};
    std::thread first([&] { released += WaitForSingleObject(thread, 10000) == WAIT_OBJECT_0; });
    std::thread second([&] { released += WaitForSingleObject(thread, 10000) == WAIT_OBJECT_0; });
    Sleep(20);
    SetEvent(shared.go);
    first.join();
    second.join();
    EXPECT_EQ(released, 2);
    CloseHandle(thread);
}

TEST(ThreadTest, TheCurrentThreadDuplicatedIsARealHandle) {
    std::atomic<HANDLE> duplicate{nullptr};
    std::atomic<bool> finish{false};
    std::thread worker([&] {
        HANDLE self = nullptr;
        EXPECT_TRUE(DuplicateHandle(GetCurrentProcess(), GetCurrentThread(), GetCurrentProcess(),
                                    &self, 0, FALSE, DUPLICATE_SAME_ACCESS));
        duplicate = self;
        while (!finish)
            Sleep(1);
    });
    while (duplicate == nullptr)
        Sleep(1);
    EXPECT_EQ(WaitForSingleObject(duplicate, 0), WAIT_TIMEOUT);
    finish = true;
    worker.join();
    EXPECT_EQ(WaitForSingleObject(duplicate, 10000), WAIT_OBJECT_0);
    EXPECT_TRUE(CloseHandle(duplicate));
    EXPECT_TRUE(CloseHandle(GetCurrentThread())) << "closing a pseudo-handle does nothing";
}

TEST(HandleTest, DuplicatesShareTheObjectAndCloseIndependently) {
    HANDLE event = CreateEventA(nullptr, TRUE, FALSE, nullptr);
    HANDLE copy = nullptr;
    ASSERT_TRUE(DuplicateHandle(GetCurrentProcess(), event, GetCurrentProcess(), &copy, 0, FALSE,
                                DUPLICATE_SAME_ACCESS));
    EXPECT_NE(copy, event);
    EXPECT_TRUE(CloseHandle(event));
    EXPECT_TRUE(SetEvent(copy));
    EXPECT_EQ(WaitForSingleObject(copy, 0), WAIT_OBJECT_0);

    HANDLE moved = nullptr;
    ASSERT_TRUE(DuplicateHandle(GetCurrentProcess(), copy, GetCurrentProcess(), &moved, 0, FALSE,
                                DUPLICATE_SAME_ACCESS | DUPLICATE_CLOSE_SOURCE));
    EXPECT_EQ(WaitForSingleObject(moved, 0), WAIT_OBJECT_0);
    // The closed source's value may be reused for the new handle at once.
    if (moved != copy) {
        SetLastError(0);
        EXPECT_FALSE(CloseHandle(copy)) << "the source was closed";
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
    }
    EXPECT_TRUE(CloseHandle(moved));
}

TEST(SleepTest, SleepsAtLeastTheGivenTime) {
    Sleep(0);
    auto start = std::chrono::steady_clock::now();
    Sleep(20);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(15));
}
