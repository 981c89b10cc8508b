// Variant times and their broken-down form, checked against the documented
// examples and an independent calendar.
#include "support/civil_oracle.h"
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>

namespace {

struct Fields {
    int year, month, day, hour, minute, second, weekday;
};

SYSTEMTIME Record(int year, int month, int day, int hour = 0, int minute = 0, int second = 0,
                  int milliseconds = 0) {
    SYSTEMTIME st = {};
    st.wYear = static_cast<WORD>(year);
    st.wMonth = static_cast<WORD>(month);
    st.wDay = static_cast<WORD>(day);
    st.wHour = static_cast<WORD>(hour);
    st.wMinute = static_cast<WORD>(minute);
    st.wSecond = static_cast<WORD>(second);
    st.wMilliseconds = static_cast<WORD>(milliseconds);
    return st;
}

void ExpectBrokenDown(double value, const Fields& expected) {
    SYSTEMTIME st = {};
    ASSERT_TRUE(VariantTimeToSystemTime(value, &st)) << value;
    EXPECT_EQ(st.wYear, expected.year) << value;
    EXPECT_EQ(st.wMonth, expected.month) << value;
    EXPECT_EQ(st.wDay, expected.day) << value;
    EXPECT_EQ(st.wHour, expected.hour) << value;
    EXPECT_EQ(st.wMinute, expected.minute) << value;
    EXPECT_EQ(st.wSecond, expected.second) << value;
    EXPECT_EQ(st.wMilliseconds, 0) << value;
    EXPECT_EQ(st.wDayOfWeek, expected.weekday) << value;
}

double ToVariant(SYSTEMTIME st) {
    double value = -12345.0;
    EXPECT_TRUE(SystemTimeToVariantTime(&st, &value));
    return value;
}

bool Converts(SYSTEMTIME st) {
    double value = 0.0;
    return SystemTimeToVariantTime(&st, &value) != FALSE;
}

TEST(VariantTimeToSystemTime, DocumentedDaysAndTimes) {
    ExpectBrokenDown(2.0, {1900, 1, 1, 0, 0, 0, 1});
    ExpectBrokenDown(2.5, {1900, 1, 1, 12, 0, 0, 1});
    ExpectBrokenDown(3.25, {1900, 1, 2, 6, 0, 0, 2});
    ExpectBrokenDown(0.0, {1899, 12, 30, 0, 0, 0, 6});
    ExpectBrokenDown(1.0, {1899, 12, 31, 0, 0, 0, 0});
    ExpectBrokenDown(29221.0, {1980, 1, 1, 0, 0, 0, 2});
    ExpectBrokenDown(33238.0, {1990, 12, 31, 0, 0, 0, 1});
    ExpectBrokenDown(29221.7508765432, {1980, 1, 1, 18, 1, 16, 2});
    ExpectBrokenDown(45351.5734953704, {2024, 2, 29, 13, 45, 50, 4});
}

TEST(VariantTimeToSystemTime, NegativeValuesTakeTheAbsoluteFractionAsTimeOfDay) {
    ExpectBrokenDown(-1.25, {1899, 12, 29, 6, 0, 0, 5});
    ExpectBrokenDown(-0.25, {1899, 12, 30, 6, 0, 0, 6});
    ExpectBrokenDown(-1.75, {1899, 12, 29, 18, 0, 0, 5});
    ExpectBrokenDown(-2.0, {1899, 12, 28, 0, 0, 0, 4});
}

TEST(VariantTimeToSystemTime, RoundsToTheNearestSecond) {
    const double second = 1.0 / 86400.0;
    ExpectBrokenDown(29221.33333333, {1980, 1, 1, 8, 0, 0, 2});
    ExpectBrokenDown(29221.9888884444, {1980, 1, 1, 23, 44, 0, 2});
    ExpectBrokenDown(29221.0 + 10.4 * second, {1980, 1, 1, 0, 0, 10, 2});
    ExpectBrokenDown(29221.0 + 10.6 * second, {1980, 1, 1, 0, 0, 11, 2});
}

TEST(VariantTimeToSystemTime, RangeIsYear100ToYear9999) {
    ExpectBrokenDown(-657434.0, {100, 1, 1, 0, 0, 0, 5});
    ExpectBrokenDown(2958465.0, {9999, 12, 31, 0, 0, 0, 5});
    ExpectBrokenDown(2958465.0 + 86399.0 / 86400.0, {9999, 12, 31, 23, 59, 59, 5});
    SYSTEMTIME st = {};
    EXPECT_FALSE(VariantTimeToSystemTime(-657435.0, &st));
    EXPECT_FALSE(VariantTimeToSystemTime(2958466.0, &st));
    EXPECT_FALSE(VariantTimeToSystemTime(1e300, &st));
    EXPECT_FALSE(VariantTimeToSystemTime(-1e300, &st));
    EXPECT_FALSE(VariantTimeToSystemTime(std::numeric_limits<double>::infinity(), &st));
    // Wine's range check lets a NaN through and fills in a date.
    if (!vaskel_test::RunningOnWine()) {
        EXPECT_FALSE(VariantTimeToSystemTime(std::numeric_limits<double>::quiet_NaN(), &st));
    }
}

TEST(SystemTimeToVariantTime, DocumentedRecords) {
    EXPECT_EQ(ToVariant(Record(1980, 1, 1)), 29221.0);
    EXPECT_EQ(ToVariant(Record(1980, 1, 2)), 29222.0);
    EXPECT_EQ(ToVariant(Record(1900, 1, 1, 12)), 2.5);
    EXPECT_EQ(ToVariant(Record(1900, 1, 2, 6)), 3.25);
    EXPECT_EQ(ToVariant(Record(100, 1, 1)), -657434.0);
    EXPECT_EQ(ToVariant(Record(9999, 1, 1)), 2958101.0);
    EXPECT_EQ(ToVariant(Record(9999, 12, 31)), 2958465.0);
    EXPECT_NEAR(ToVariant(Record(1980, 1, 1, 18, 1, 16)), 29221.75087962963, 1e-11);
}

TEST(SystemTimeToVariantTime, DatesBeforeTheEpochCarryTheTimeAsANegativeFraction) {
    EXPECT_EQ(ToVariant(Record(1899, 12, 29, 6)), -1.25);
    EXPECT_EQ(ToVariant(Record(1899, 12, 30, 6)), 0.25);
    EXPECT_EQ(ToVariant(Record(1899, 12, 28, 18)), -2.75);
}

TEST(SystemTimeToVariantTime, IgnoresMillisecondsAndTheWeekday) {
    SYSTEMTIME st = Record(1900, 1, 1, 12, 0, 0, 999);
    st.wDayOfWeek = 5;
    EXPECT_EQ(ToVariant(st), 2.5);
}

// Two-digit years up to 29 are 2000-2029, the rest 1930-1999: the system's
// documented default window.
TEST(SystemTimeToVariantTime, TwoDigitYearsUseTheWindow) {
    EXPECT_EQ(ToVariant(Record(90, 12, 31)), 33238.0);
    EXPECT_EQ(ToVariant(Record(50, 1, 1)), ToVariant(Record(1950, 1, 1)));
    EXPECT_EQ(ToVariant(Record(29, 1, 1)), 47119.0);
    EXPECT_EQ(ToVariant(Record(0, 1, 1)), 36526.0);
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine 8 reads 30-49 as 2030-2049";
    EXPECT_EQ(ToVariant(Record(30, 1, 1)), 10959.0);
    EXPECT_EQ(ToVariant(Record(49, 1, 1)), ToVariant(Record(1949, 1, 1)));
}

TEST(SystemTimeToVariantTime, ZeroDayAndMonthStepBackAndLongDaysRollForward) {
    EXPECT_EQ(ToVariant(Record(1980, 1, 0)), 29220.0);
    EXPECT_EQ(ToVariant(Record(1980, 0, 1)), 29190.0);
    EXPECT_EQ(ToVariant(Record(1980, 0, 0)), 29189.0);
    EXPECT_EQ(ToVariant(Record(1981, 2, 29)), ToVariant(Record(1981, 3, 1)));
    EXPECT_EQ(ToVariant(Record(1980, 4, 31)), ToVariant(Record(1980, 5, 1)));
    EXPECT_EQ(ToVariant(Record(1980, 2, 29)), 29280.0);
}

TEST(SystemTimeToVariantTime, TimeFieldsRollBothWaysAsSignedNumbers) {
    EXPECT_EQ(ToVariant(Record(1980, 1, 1, 24)), 29222.0);
    EXPECT_EQ(ToVariant(Record(1980, 1, 1, 0, 0, 90)), ToVariant(Record(1980, 1, 1, 0, 1, 30)));
    EXPECT_EQ(ToVariant(Record(1980, 1, 1, -1)), ToVariant(Record(1979, 12, 31, 23)));
    EXPECT_EQ(ToVariant(Record(1980, 1, 1, 0, -1)), ToVariant(Record(1979, 12, 31, 23, 59)));
    EXPECT_EQ(ToVariant(Record(0, 0, 0, 6)), ToVariant(Record(1999, 11, 30, 6)));
}

TEST(SystemTimeToVariantTime, RejectsFieldsOutOfRange) {
    EXPECT_FALSE(Converts(Record(1980, 13, 1)));
    EXPECT_FALSE(Converts(Record(1980, 1, 32)));
    EXPECT_FALSE(Converts(Record(65535, 1, 1)));
    EXPECT_FALSE(Converts(Record(10000, 1, 1)));
    // Wine dereferences a null record.
    if (!vaskel_test::RunningOnWine()) {
        double value = 0.0;
        EXPECT_FALSE(SystemTimeToVariantTime(nullptr, &value));
    }
}

TEST(VariantTime, AgreesWithAnIndependentCalendarAcrossTheRange) {
    std::mt19937_64 random(20261206);
    std::uniform_int_distribution<long long> anyDay(-657434, 2958465);
    std::uniform_int_distribution<int> anySecond(0, 86399);
    for (int i = 0; i < 20000; ++i) {
        // Both ends of the range and the epoch, then random days.
        const long long day = i < 400   ? (i < 200 ? -657434 + i : 2958465 - (i - 200))
                              : i < 500 ? i - 450
                                        : anyDay(random);
        const int seconds = anySecond(random);
        const vaskel_test::OracleDate date = vaskel_test::OracleDateOfVariantDay(day);

        const SYSTEMTIME record =
            Record(date.year, static_cast<int>(date.month), static_cast<int>(date.day),
                   seconds / 3600, seconds / 60 % 60, seconds % 60);
        double value = 0.0;
        ASSERT_TRUE(SystemTimeToVariantTime(const_cast<SYSTEMTIME*>(&record), &value)) << day;
        ASSERT_EQ(std::trunc(value), static_cast<double>(day)) << day;
        ASSERT_EQ(vaskel_test::OracleVariantDay(date.year, date.month, date.day), day);

        SYSTEMTIME back = {};
        ASSERT_TRUE(VariantTimeToSystemTime(value, &back)) << value;
        ASSERT_EQ(back.wYear, date.year) << day;
        ASSERT_EQ(back.wMonth, date.month) << day;
        ASSERT_EQ(back.wDay, date.day) << day;
        ASSERT_EQ(back.wDayOfWeek, date.weekday) << day;
        ASSERT_EQ(back.wHour * 3600 + back.wMinute * 60 + back.wSecond, seconds) << value;
    }
}

} // namespace
