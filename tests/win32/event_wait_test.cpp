// Events and the waits on them.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <string>
#include <thread>

namespace {

struct Handle {
    explicit Handle(HANDLE h) : h(h) {}
    ~Handle() {
        if (h)
            CloseHandle(h);
    }
    Handle(const Handle&) = delete;
    Handle& operator=(const Handle&) = delete;
    operator HANDLE() const { return h; }
    HANDLE h;
};

HANDLE NewEvent(bool manualReset, bool initialState) {
    return CreateEventA(nullptr, manualReset, initialState, nullptr);
}

std::string UniqueName(const char* stem) {
    return std::string("vaskel-test-") + stem + "-" + std::to_string(GetCurrentProcessId());
}

} // namespace

TEST(EventTest, AutoResetIsConsumedByOneWait) {
    Handle event(NewEvent(false, false));
    ASSERT_NE(event.h, nullptr);
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_TIMEOUT);
    EXPECT_TRUE(SetEvent(event));
    EXPECT_TRUE(SetEvent(event)) << "setting a set event is no error";
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_OBJECT_0);
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_TIMEOUT);
}

TEST(EventTest, ManualResetStaysSignalledUntilReset) {
    Handle event(NewEvent(true, true));
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_OBJECT_0);
    EXPECT_TRUE(ResetEvent(event));
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_TIMEOUT);
}

TEST(EventTest, ANamedEventIsOpenedAgainByName) {
    std::string name = UniqueName("named");
    Handle first(CreateEventA(nullptr, TRUE, FALSE, name.c_str()));
    ASSERT_NE(first.h, nullptr) << "error " << GetLastError() << " for " << name;
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_SUCCESS));
    Handle second(CreateEventA(nullptr, FALSE, TRUE, name.c_str())); // flags are ignored
    ASSERT_NE(second.h, nullptr);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_ALREADY_EXISTS));
    EXPECT_EQ(WaitForSingleObject(second, 0), WAIT_TIMEOUT);
    SetEvent(first);
    EXPECT_EQ(WaitForSingleObject(second, 0), WAIT_OBJECT_0);
    EXPECT_EQ(WaitForSingleObject(second, 0), WAIT_OBJECT_0) << "still manual reset";

    CloseHandle(first.h);
    first.h = nullptr;
    CloseHandle(second.h);
    second.h = nullptr;
    Handle fresh(CreateEventA(nullptr, FALSE, FALSE, name.c_str()));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_SUCCESS)) << "the name died with its event";
}

TEST(EventTest, NamesLiveInTheSessionNamespace) {
    std::string name = UniqueName("session");
    Handle local(CreateEventA(nullptr, TRUE, FALSE, ("Local\\" + name).c_str()));
    ASSERT_NE(local.h, nullptr) << "error " << GetLastError();
    Handle plain(CreateEventA(nullptr, TRUE, FALSE, name.c_str()));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_ALREADY_EXISTS));

    SetLastError(0);
    std::string nested = UniqueName("no-such-directory") + "\\inner";
    EXPECT_EQ(CreateEventA(nullptr, TRUE, FALSE, nested.c_str()), nullptr);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_PATH_NOT_FOUND));
}

TEST(EventTest, InvalidHandlesFail) {
    HANDLE closed = NewEvent(false, false);
    CloseHandle(closed);
    for (HANDLE bad : {static_cast<HANDLE>(nullptr), closed}) {
        SetLastError(0);
        EXPECT_FALSE(SetEvent(bad));
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
        EXPECT_FALSE(ResetEvent(bad));
        EXPECT_FALSE(PulseEvent(bad));
        EXPECT_EQ(WaitForSingleObject(bad, 0), WAIT_FAILED);
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
    }
}

TEST(EventTest, APulseReleasesAWaiterAndLeavesTheEventReset) {
    Handle event(NewEvent(false, false));
    EXPECT_TRUE(PulseEvent(event));
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_TIMEOUT) << "no waiter: nothing stays set";

    std::atomic<bool> released{false};
    std::thread waiter([&] {
        WaitForSingleObject(event, INFINITE);
        released = true;
    });
    // Pulse until the waiter has begun to wait and is released by one.
    for (int i = 0; i < 10000 && !released; ++i) {
        PulseEvent(event);
        Sleep(1);
    }
    waiter.join();
    EXPECT_TRUE(released);
    EXPECT_EQ(WaitForSingleObject(event, 0), WAIT_TIMEOUT);
}

TEST(WaitTest, WaitForAnyTakesOnlyTheLowestSignalledObject) {
    Handle first(NewEvent(false, true)), second(NewEvent(false, true));
    HANDLE both[] = {first, second};
    EXPECT_EQ(WaitForMultipleObjects(2, both, FALSE, 0), WAIT_OBJECT_0);
    EXPECT_EQ(WaitForMultipleObjects(2, both, FALSE, 0), WAIT_OBJECT_0 + 1);
    EXPECT_EQ(WaitForMultipleObjects(2, both, FALSE, 0), WAIT_TIMEOUT);
}

TEST(WaitTest, WaitForAllTakesNothingUntilEverythingIsSignalled) {
    Handle first(NewEvent(false, true)), second(NewEvent(false, false));
    HANDLE both[] = {first, second};
    EXPECT_EQ(WaitForMultipleObjects(2, both, TRUE, 0), WAIT_TIMEOUT);
    EXPECT_EQ(WaitForMultipleObjects(2, both, TRUE, 20), WAIT_TIMEOUT);
    EXPECT_EQ(WaitForSingleObject(first, 0), WAIT_OBJECT_0) << "the partial wait took nothing";

    std::atomic<DWORD> result{WAIT_FAILED};
    std::thread waiter([&] { result = WaitForMultipleObjects(2, both, TRUE, INFINITE); });
    SetEvent(first);
    Sleep(20);
    SetEvent(second);
    waiter.join();
    EXPECT_EQ(result, WAIT_OBJECT_0);
    EXPECT_EQ(WaitForSingleObject(first, 0), WAIT_TIMEOUT) << "both were taken together";
    EXPECT_EQ(WaitForSingleObject(second, 0), WAIT_TIMEOUT);
}

TEST(WaitTest, AnObjectSignalledWhileAWaitForAllIsPendingStaysAvailable) {
    Handle first(NewEvent(false, false)), second(NewEvent(false, false));
    HANDLE both[] = {first, second};
    std::atomic<DWORD> result{WAIT_FAILED};
    std::thread waiter([&] { result = WaitForMultipleObjects(2, both, TRUE, INFINITE); });
    SetEvent(first);
    EXPECT_EQ(WaitForSingleObject(first, 5000), WAIT_OBJECT_0)
        << "the pending wait did not hold it";
    SetEvent(first);
    SetEvent(second);
    waiter.join();
    EXPECT_EQ(result, WAIT_OBJECT_0);
}

TEST(WaitTest, TimeOutsAndBadArguments) {
    Handle event(NewEvent(true, false));
    auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(WaitForSingleObject(event, 50), WAIT_TIMEOUT);
    EXPECT_GE(std::chrono::steady_clock::now() - start, std::chrono::milliseconds(40));

    HANDLE handles[MAXIMUM_WAIT_OBJECTS + 1];
    for (HANDLE& h : handles)
        h = NewEvent(false, false);
    SetLastError(0);
    EXPECT_EQ(WaitForMultipleObjects(0, handles, FALSE, 0), WAIT_FAILED);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
    EXPECT_EQ(WaitForMultipleObjects(MAXIMUM_WAIT_OBJECTS + 1, handles, FALSE, 0), WAIT_FAILED);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
    SetEvent(handles[MAXIMUM_WAIT_OBJECTS - 1]);
    EXPECT_EQ(WaitForMultipleObjects(MAXIMUM_WAIT_OBJECTS, handles, FALSE, 0),
              WAIT_OBJECT_0 + MAXIMUM_WAIT_OBJECTS - 1);
    for (HANDLE h : handles)
        CloseHandle(h);
}

#ifndef _WIN32
// Windows leaves this undefined; here the waiter keeps its own reference.
TEST(WaitTest, ClosingAHandleWhileAnotherThreadWaitsOnItIsSafe) {
    HANDLE event = NewEvent(false, false);
    std::atomic<DWORD> result{WAIT_FAILED};
    std::thread waiter([&] { result = WaitForSingleObject(event, 200); });
    Sleep(20);
    EXPECT_TRUE(CloseHandle(event));
    waiter.join();
    EXPECT_EQ(result, WAIT_TIMEOUT);
}
#endif
