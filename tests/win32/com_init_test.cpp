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
