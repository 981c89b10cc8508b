// Tests of times of day: which operations keep the fraction's sign and which
// wrap it, wrapping shifts, and the join with a date.
#include <vaskel/calendar.h>
#include <vaskel/diag.h>

#include <gtest/gtest.h>

using namespace vaskel;

namespace {

TEST(CTimeTest, PlainAndWrappedFractions) {
    EXPECT_EQ(CTime(45000.75).GetValue(), 0.75);
    EXPECT_EQ(CTime(CDateTime(45000.75)).GetValue(), 0.75);
    EXPECT_EQ(CTime(-1.25).GetValue(), -0.25);
    CTime time;
    time.SetValue(-1.25);
    EXPECT_EQ(time.GetValue(), 0.75);
    time = 45000.75;
    EXPECT_EQ(time.GetValue(), 45000.75) << "assignment stores the number as it is";
    EXPECT_EQ(time.GetHour(), 18u);
    EXPECT_TRUE(CTime().IsNull());
}

TEST(CTimeTest, FromFieldsAndRecords) {
    CTime time(6, 0, 0);
    EXPECT_EQ(time.GetValue(), 0.25);
    EXPECT_TRUE(time.SetTime(13, 45, 10));
    EXPECT_EQ(time.GetHour(), 13u);
    EXPECT_EQ(time.GetMinute(), 45u);
    EXPECT_EQ(time.GetSecond(), 10u);
    EXPECT_EQ(time.GetMinuteOfTheDay(), 13 * 60 + 45);
    // Fields roll in both directions.
    EXPECT_TRUE(time.SetTime(-1, 0, 0));
    EXPECT_EQ(time.GetHour(), 23u);
    EXPECT_TRUE(time.SetTime(25, 0, 90));
    EXPECT_EQ(time.GetHour(), 1u);
    EXPECT_EQ(time.GetMinute(), 1u);
    EXPECT_EQ(time.GetSecond(), 30u);

    // A record before 30 December 1899 still gives its own time of day.
    SYSTEMTIME early = {};
    early.wYear = 1850;
    early.wMonth = 6;
    early.wDay = 1;
    early.wHour = 6;
    EXPECT_TRUE(time.FromSystemTime(early));
    EXPECT_EQ(time.GetValue(), 0.25);
    EXPECT_EQ(CTime(early).GetHour(), 6u);
    early.wMonth = 13;
    EXPECT_FALSE(time.FromSystemTime(early));
    EXPECT_EQ(time.GetValue(), 0.25);
}

TEST(CTimeTest, ShiftsWrapAroundMidnight) {
    CTime time;
    time.AddMinutes(-1);
    EXPECT_EQ(time.GetValue(), 0.9993055555555556);
    EXPECT_EQ(time.GetMinuteOfTheDay(), 1439);
    time.AddSeconds(60);
    EXPECT_NEAR(time.GetValue(), 0.0, 1e-15);
    time.SetValue(0.75);
    time.AddMinutes(12 * 60);
    EXPECT_DOUBLE_EQ(time.GetValue(), 0.25);

    // 0.1 minus the span 0.2: operator- keeps the sign, -= wraps.
    const CTimeSpan span(0.2);
    ASSERT_EQ(span.GetSpan(), 0.19999999999999998);
    EXPECT_EQ((CTime(0.1) - span).GetValue(), -0.09999999999999998);
    CTime wrapped(0.1);
    wrapped -= span;
    EXPECT_DOUBLE_EQ(wrapped.GetValue(), 0.9);
    wrapped += CTimeSpan(0.2);
    EXPECT_NEAR(wrapped.GetValue(), 0.1, 1e-15);
    EXPECT_EQ((CTime(0.9) + CTimeSpan(0.2)).GetValue(), CTime(0.9 + span.GetSpan()).GetValue());
}

TEST(CTimeTest, JoinsADateAndTakesDifferences) {
    EXPECT_EQ((CTime(0.5) + CJulianDate(2)).GetValue(), 2.5);
    EXPECT_EQ(CTime(0.5).ToDateTime().GetValue(), 0.5);
    EXPECT_EQ(CTime(0.75) - CTime(0.25), CTimeSpan(0.5));
    EXPECT_TRUE(CTime(0.25) < CTime(0.5));
    EXPECT_TRUE(CTime(0.25) == 0.25);
    EXPECT_EQ(CTime(0.25).Compare(0.5), -1);
    const double now = CTime::Now().GetValue();
    EXPECT_GE(now, 0.0);
    EXPECT_LT(now, 1.0);
}

} // namespace
