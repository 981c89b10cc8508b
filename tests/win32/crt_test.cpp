// Runtime-library functions: the floating-point status word and multibyte
// case mapping.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

TEST(CrtTest, ZeroDivideIsRecordedUntilCleared) {
    const unsigned int zeroDivide = _SW_ZERODIVIDE, invalid = _SW_INVALID;
    volatile double value = 0.0; // keeps the arithmetic at run time
    _clearfp();
    value = 1.0 / value;
    EXPECT_EQ(_statusfp() & (zeroDivide | invalid), zeroDivide);
    EXPECT_EQ(_clearfp() & zeroDivide, zeroDivide); // the status before clearing
    EXPECT_EQ(_statusfp() & zeroDivide, 0u);
    value = value - value; // infinity less infinity: invalid, no division by zero
    EXPECT_EQ(_clearfp() & (zeroDivide | invalid), invalid);
}

TEST(CrtTest, MbctolowerChangesOnlyCapitalLetters) {
    for (unsigned int c : {'A', 'Z'})
        EXPECT_EQ(_mbctolower(c), c + ('a' - 'A'));
    for (unsigned int c : {'@', '[', 'a', 'z', '0', '\0'})
        EXPECT_EQ(_mbctolower(c), c);
}
