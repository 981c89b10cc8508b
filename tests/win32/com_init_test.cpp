// A thread's COM apartment.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <thread>

TEST(ComInitTest, CountsNestedInitialisationsPerThread) {
    std::thread worker([] {
        EXPECT_EQ(CoInitialize(nullptr), S_OK);
        EXPECT_EQ(CoInitialize(nullptr), S_FALSE);
        EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), RPC_E_CHANGED_MODE);
        std::thread other([] {
            EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK) << "per thread";
            CoUninitialize();
        });
        other.join();
        CoUninitialize();
        CoUninitialize();
        EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK) << "balanced: left";
        CoUninitialize();
    });
    worker.join();
}

TEST(ComInitTest, UninitialisingOutsideAnApartmentDoesNothing) {
    std::thread worker([] {
        CoUninitialize();
        CoUninitialize();
        EXPECT_EQ(CoInitialize(nullptr), S_OK) << "no count was taken below zero";
        EXPECT_EQ(CoInitialize(nullptr), S_FALSE);
        CoUninitialize();
        CoUninitialize();
        EXPECT_EQ(CoInitialize(nullptr), S_OK) << "left by the balanced calls";
        CoUninitialize();
    });
    worker.join();
}

TEST(ComInitTest, ThreadsOfTheMultithreadedApartmentCountIndependently) {
    std::thread first([] {
        ASSERT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK);
        std::thread second([] {
            EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_OK)
                << "each thread enters the shared apartment itself";
            EXPECT_EQ(CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED), RPC_E_CHANGED_MODE);
            CoUninitialize();
        });
        second.join();
        EXPECT_EQ(CoInitializeEx(nullptr, COINIT_MULTITHREADED), S_FALSE)
            << "the other thread's leaving did not end this one's";
        CoUninitialize();
        CoUninitialize();
    });
    first.join();
}
