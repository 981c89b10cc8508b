#include <vaskel/calendar.h>

#include <gtest/gtest.h>

using vaskel::CTimeSpan;

TEST(CTimeSpanTest, ProducersRoundToMillisecondsByTheReciprocal) {
    const double tenthOfADay = 8640000 * 1.1574074074074074e-08;
    EXPECT_EQ(CTimeSpan(0.1).GetSpan(), tenthOfADay);
    EXPECT_EQ(CTimeSpan(0, 2.4, 0, 0, 0), CTimeSpan(0.1)) << "equal bit for bit";
    EXPECT_FALSE(CTimeSpan(0.1) == 0.1);
    const struct {
        double milliseconds;
        double stored;
    } rounding[] = {{0.5, 1}, {-0.5, -1}, {0.49, 0}, {2.5, 3}};
    for (const auto& r : rounding)
        EXPECT_EQ(CTimeSpan().SetMillisecondsSpan(r.milliseconds).GetTotalMilliseconds(),
                  r.stored * 86400000.0 * 1.1574074074074074e-08)
            << r.milliseconds;
    EXPECT_EQ(CTimeSpan(0, 25, 0, 0, 0), CTimeSpan(1, 1, 0, 0, 0));
    EXPECT_EQ(CTimeSpan(1, -1, 0, 0, 0), CTimeSpan(0, 23, 0, 0, 0));
    EXPECT_EQ(CTimeSpan().SetMinuteSpan(90), CTimeSpan(0, 1, 30, 0, 0));
}

TEST(CTimeSpanTest, WholeAndPartialUnitsAndComponents) {
    CTimeSpan hours;
    hours.SetHourSpan(1.2);
    EXPECT_EQ(hours.GetPartialHours(), 2);
    EXPECT_EQ(hours.GetFullHours(), 1);
    hours.SetHourSpan(-1.2);
    EXPECT_EQ(hours.GetPartialHours(), -2);
    EXPECT_EQ(hours.GetFullHours(), -1);

    CTimeSpan span(1.25);
    EXPECT_EQ(span.GetHours(), 6);
    EXPECT_EQ((-span).GetHours(), -6);
    CTimeSpan parts(1, 2, 3, 4, 5);
    EXPECT_EQ(parts.GetDays(), 1);
    EXPECT_EQ(parts.GetMinutes(), 3);
    EXPECT_EQ(parts.GetSeconds(), 4);
    EXPECT_EQ(CTimeSpan(1, 5, 0, 0, 0).GetHours(), 4) << "binary products truncate";
    CTimeSpan huge(1e12);
    EXPECT_EQ(huge.GetFullMilliseconds(), 2147483647L) << "saturates instead of overflowing";
}

TEST(CTimeSpanTest, ArithmeticRoundsWhileCompoundAssignmentDoesNot) {
    CTimeSpan a(0.1), b(1.0 / 3.0);
    EXPECT_EQ((a + b) - b, CTimeSpan(((a + b) - b).GetSpan()));
    CTimeSpan raw = a;
    raw += b;
    EXPECT_EQ(raw.GetSpan(), a.GetSpan() + b.GetSpan());
    raw -= b;
    EXPECT_EQ(raw.GetSpan(), (a.GetSpan() + b.GetSpan()) - b.GetSpan());
    EXPECT_LT(CTimeSpan(-1), CTimeSpan(0));
    EXPECT_GE(CTimeSpan(2), 2.0);
}

TEST(CTimeSpanTest, TextForms) {
    EXPECT_STREQ(CTimeSpan(1, 2, 3, 4, 5).ToString(), "1. 2. 3. 4.  5");
    EXPECT_STREQ(CTimeSpan(1.25).ToString(), "1. 6. 0. 0.  0");
    EXPECT_STREQ(CTimeSpan(-1.25).ToString(), "-1.-6. 0. 0.  0");
    EXPECT_STREQ(CTimeSpan().ToString(), "0. 0. 0. 0.  0");

    using vaskel::Minutes;
    using vaskel::Seconds;
    const struct {
        CTimeSpan span;
        int resolution; // 19: nothing rounded, nothing dropped
        const char* text;
    } remaining[] = {
        {CTimeSpan(), 19, ""},
        {CTimeSpan(1, 2, 30, 0, 0), 19, "1 day 2 hours"},
        {CTimeSpan(0, 0, 0, 90, 0), 19, "1 minute 30 seconds"},
        {CTimeSpan(0, 0, 0, 90, 0), Minutes, "2 minutes"},
        {CTimeSpan(0, 0, 0, 59.6, 0), Seconds, "1 minute"},
        {CTimeSpan(0, 0, 0, 0.4, 0), 19, "400 milliseconds"},
        {CTimeSpan(0, 0, 0, 0.4, 0), Seconds, ""},
        {CTimeSpan(0, 1, 0, 0, 0), 19, "1 hour"},
        {CTimeSpan(0, 0, -2, 0, 0), 19, "-2 minutes"},
        {CTimeSpan(-1.25), 19, "-1 days -6 hours"},
        {CTimeSpan(2, 0, 5, 0, 0), 19, "2 days 5 minutes"},
    };
    for (const auto& r : remaining)
        EXPECT_STREQ(
            r.span.ToStringAsTimeRemaining(static_cast<vaskel::ETimeResolution>(r.resolution)),
            r.text)
            << r.span.GetSpan() << " at " << r.resolution;
    EXPECT_STREQ(CTimeSpan(0, 0, 0, 90, 0).ToStringAsTimeRemaining(), "1 minute 30 seconds");
}
