// Thread and process identity, and the per-thread last-error value.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

#ifndef _WIN32
#include <unistd.h>
#endif

namespace {

// Lets a number of threads wait until all of them have arrived, so that each
// thread is known to be alive while the others look at it.
class Rendezvous {
public:
    explicit Rendezvous(int count) : m_waiting(count) {}

    void ArriveAndWait() {
        std::unique_lock<std::mutex> lock(m_mutex);
        if (--m_waiting == 0)
            m_allHere.notify_all();
        else
            m_allHere.wait(lock, [this] { return m_waiting == 0; });
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_allHere;
    int m_waiting;
};

TEST(ThreadIdentityTest, ThreadIdIsNonZeroAndStable) {
    DWORD id = GetCurrentThreadId();
    EXPECT_NE(id, 0u);
    EXPECT_EQ(GetCurrentThreadId(), id);
}

TEST(ThreadIdentityTest, LiveThreadsHaveDistinctIds) {
    Rendezvous rendezvous(3);
    DWORD first = 0;
    DWORD second = 0;
    DWORD firstAgain = 0;
    std::thread a([&] {
        first = GetCurrentThreadId();
        rendezvous.ArriveAndWait();
        firstAgain = GetCurrentThreadId();
    });
    std::thread b([&] {
        second = GetCurrentThreadId();
        rendezvous.ArriveAndWait();
    });
    rendezvous.ArriveAndWait();
    DWORD main = GetCurrentThreadId();
    a.join();
    b.join();

    EXPECT_NE(first, 0u);
    EXPECT_NE(second, 0u);
    EXPECT_NE(first, second);
    EXPECT_NE(first, main);
    EXPECT_NE(second, main);
    EXPECT_EQ(firstAgain, first);
    EXPECT_EQ(GetCurrentThreadId(), main);
}

TEST(ThreadIdentityTest, ProcessIdIsTheSameInEveryThread) {
    DWORD id = GetCurrentProcessId();
    EXPECT_NE(id, 0u);
    EXPECT_EQ(GetCurrentProcessId(), id);
    DWORD fromThread = 0;
    std::thread([&] { fromThread = GetCurrentProcessId(); }).join();
    EXPECT_EQ(fromThread, id);
#ifndef _WIN32
    EXPECT_EQ(id, static_cast<DWORD>(::getpid()));
#endif
}

TEST(ThreadIdentityTest, LastErrorIsPerThread) {
    // The threads take turns through an atomic step counter alone: on Windows
    // a mutex or condition variable may itself change the last error.
    std::atomic<int> step{0};
    auto waitFor = [&step](int value) {
        while (step.load() != value) {
        }
    };
    DWORD seenByThread = 0;
    std::thread other([&] {
        waitFor(1);
        SetLastError(ERROR_ACCESS_DENIED);
        step = 2;
        waitFor(3);
        seenByThread = GetLastError();
    });
    SetLastError(ERROR_INVALID_HANDLE);
    step = 1;
    waitFor(2);
    DWORD seenByMain = GetLastError(); // after the other thread set its own
    SetLastError(ERROR_NOT_ENOUGH_MEMORY);
    step = 3;
    other.join();

    EXPECT_EQ(seenByMain, ERROR_INVALID_HANDLE);
    EXPECT_EQ(seenByThread, ERROR_ACCESS_DENIED); // after ours changed again
}

} // namespace
