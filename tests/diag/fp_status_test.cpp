#include <vaskel/diag.h>

#include <gtest/gtest.h>

namespace {

double Divide(double a, double b) {
    volatile double numerator = a, denominator = b;
    return numerator / denominator;
}

} // namespace

TEST(FloatingPointStatus, ClearReturnsTheFlagsRaisedBeforeAndClearsThem) {
    vaskel::ClearStatus87();
    EXPECT_EQ(vaskel::GetStatus87() & _SW_ZERODIVIDE, 0u);

    volatile double infinity = Divide(1.0, 0.0);
    (void)infinity;
    EXPECT_NE(vaskel::GetStatus87() & _SW_ZERODIVIDE, 0u);

    DWORD before = vaskel::ClearStatus87();
    EXPECT_NE(before & _SW_ZERODIVIDE, 0u);
    EXPECT_EQ(vaskel::GetStatus87() & _SW_ZERODIVIDE, 0u);
}

TEST(FloatingPointStatus, InvalidOperationIsReported) {
    vaskel::ClearStatus87();
    volatile double nan = Divide(0.0, 0.0);
    (void)nan;
    EXPECT_NE(vaskel::ClearStatus87() & _SW_INVALID, 0u);
}

TEST(ThreadName, AcceptsAnyNameAndThread) {
    vaskel::VKSetThreadName("worker", 0xFFFFFFFF);
    vaskel::VKSetThreadName("", 0);
    vaskel::VKSetThreadName(nullptr, 1234);
}
