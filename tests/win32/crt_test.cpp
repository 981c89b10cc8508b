// Runtime-library functions: the floating-point status word and multibyte
// case mapping.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

namespace {

TEST(FloatingPointStatusTest, DivisionByZeroIsRecordedUntilCleared) {
    _clearfp();
    EXPECT_EQ(_statusfp() & _SW_ZERODIVIDE, 0u);

    // Volatile operands keep the division at run time.
    volatile double numerator = 1.0;
    volatile double denominator = 0.0;
    volatile double quotient = numerator / denominator;
    (void)quotient;

    EXPECT_NE(_statusfp() & _SW_ZERODIVIDE, 0u);
    EXPECT_NE(_statusfp() & _SW_ZERODIVIDE, 0u); // reading does not clear
    EXPECT_NE(_clearfp() & _SW_ZERODIVIDE, 0u);  // the status before clearing
    EXPECT_EQ(_statusfp() & _SW_ZERODIVIDE, 0u);
}

TEST(FloatingPointStatusTest, OtherExceptionsAreTheirOwnFlags) {
    _clearfp();
    volatile double zero = 0.0;
    volatile double invalid = zero / zero;
    (void)invalid;
    unsigned int status = _clearfp();
    EXPECT_NE(status & _SW_INVALID, 0u);
    EXPECT_EQ(status & _SW_ZERODIVIDE, 0u);

    volatile double huge = 1e308;
    volatile double overflow = huge * 10.0;
    (void)overflow;
    status = _clearfp();
    EXPECT_NE(status & _SW_OVERFLOW, 0u);
    EXPECT_EQ(status & _SW_INVALID, 0u);
}

TEST(MultibyteCaseTest, AsciiLettersChangeCase) {
    EXPECT_EQ(_mbctolower('A'), static_cast<unsigned int>('a'));
    EXPECT_EQ(_mbctolower('Z'), static_cast<unsigned int>('z'));
    EXPECT_EQ(_mbctoupper('a'), static_cast<unsigned int>('A'));
    EXPECT_EQ(_mbctoupper('z'), static_cast<unsigned int>('Z'));
}

TEST(MultibyteCaseTest, OtherAsciiIsUnchanged) {
    for (unsigned int c : {'a', 'z', '0', '9', '@', '[', '`', '{', ' ', '\0'})
        EXPECT_EQ(_mbctolower(c), c);
    for (unsigned int c : {'A', 'Z', '0', '@', '[', '`', '{'})
        EXPECT_EQ(_mbctoupper(c), c);
}

} // namespace
