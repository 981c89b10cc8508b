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

TEST(CrtTest, FixedPointConversionGivesDigitsPointAndSign) {
    const struct {
        double value;
        int count;
        const char* digits;
        int point;
        int sign;
    } cases[] = {
        {0.0, 4, "0000", 0, 0},
        {-0.0, 2, "00", 0, 1},
        {1e-20, 16, "", -16, 0},
        {0.05, 16, "500000000000000", -1, 0},
        {2.5, 0, "3", 1, 0}, // an exact tie goes away from zero
        {0.125, 2, "13", 0, 0},
        {-2.5, 1, "25", 1, 1},
        {1e20, 2, "10000000000000000000000", 21, 0},
        {1.1, 16, "11000000000000001", 1, 0},
        {0.0005, 3, "1", -2, 0},
        {0.9999, 2, "100", 1, 0},
        {99.5, 0, "100", 3, 0},
    };
    for (const auto& c : cases) {
        char buffer[_CVTBUFSIZE];
        int point = 99, sign = 99;
        ASSERT_EQ(_fcvt_s(buffer, sizeof buffer, c.value, c.count, &point, &sign), 0) << c.value;
        EXPECT_STREQ(buffer, c.digits) << c.value << " with " << c.count;
        EXPECT_EQ(point, c.point) << c.value;
        EXPECT_EQ(sign, c.sign) << c.value;
    }
}
