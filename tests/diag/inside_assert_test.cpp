#include <vaskel/diag.h>

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <thread>

using vaskel::CVKInsideAssert;

TEST(CVKInsideAssert, NestedMarkersKeepTheStateUntilTheLastIsGone) {
    EXPECT_FALSE(CVKInsideAssert::IsInsideAssert());
    {
        CVKInsideAssert outer;
        EXPECT_TRUE(CVKInsideAssert::IsInsideAssert());
        {
            CVKInsideAssert inner;
            EXPECT_EQ(CVKInsideAssert::m_nInsideAssert, 2u);
        }
        EXPECT_TRUE(CVKInsideAssert::IsInsideAssert());
    }
    EXPECT_FALSE(CVKInsideAssert::IsInsideAssert());
    EXPECT_EQ(CVKInsideAssert::m_nInsideAssert, 0u);
}

TEST(CVKInsideAssert, IsProcessWide) {
    std::atomic<bool> marked{false}, release{false};
    std::thread reporter([&] {
        CVKInsideAssert marker;
        marked = true;
        while (!release)
            std::this_thread::yield();
    });
    while (!marked)
        std::this_thread::yield();
    EXPECT_TRUE(CVKInsideAssert::IsInsideAssert());
    release = true;
    reporter.join();
    EXPECT_FALSE(CVKInsideAssert::IsInsideAssert());
}

TEST(CVKInsideAssert, ConcurrentMarkersBalance) {
    std::thread threads[4];
    for (auto& t : threads)
        t = std::thread([] {
            for (int i = 0; i < 10000; ++i)
                CVKInsideAssert marker;
        });
    for (auto& t : threads)
        t.join();
    EXPECT_EQ(CVKInsideAssert::m_nInsideAssert, 0u);
}
