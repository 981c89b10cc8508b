// Tests of dates: the weekday rule, construction from fields, month and
// year shifts with the February rule, spans and comparisons.
#include <vaskel/calendar.h>
#include <vaskel/diag.h>

#include <gtest/gtest.h>

using namespace vaskel;

namespace {

CJulianDate Date(int year, int month, int day) {
    CJulianDate date;
    EXPECT_TRUE(date.SetDate(year, month, day)) << year << '-' << month << '-' << day;
    return date;
}

void ExpectDate(const CJulianDate& date, DWORD year, DWORD month, DWORD day) {
    EXPECT_EQ(date.GetYear(), year);
    EXPECT_EQ(date.GetMonth(), month);
    EXPECT_EQ(date.GetDay(), day);
}

TEST(CJulianDateTest, WeekdaysCountFromSundayOnDayOne) {
    EXPECT_EQ(DayOfWeekX::FromJulianDate(0), Saturday);
    EXPECT_EQ(DayOfWeekX::FromJulianDate(1), Sunday);
    EXPECT_EQ(DayOfWeekX::FromJulianDate(2), Monday);
    EXPECT_EQ(DayOfWeekX::FromJulianDate(45351), Thursday); // 29 February 2024
    EXPECT_EQ(DayOfWeekX::FromJulianDate(0xFFFFFFFF), Tuesday);
    EXPECT_EQ(CDateTime(2.5).GetDayOfTheWeek(), Monday);
    EXPECT_EQ(CDateTime(-1.25).GetDayOfTheWeek(), Friday);
    EXPECT_EQ(DayOfWeekX::TodaysDay(), CDateTime::Now().GetDayOfTheWeek());
}

TEST(CJulianDateTest, FieldsAndConversions) {
    ExpectDate(CJulianDate(2), 1900, 1, 1);
    EXPECT_EQ(Date(2024, 2, 29).GetValue(), 45351u);
    EXPECT_EQ(CJulianDate(2024, 2, 29).GetCalendarMonth(), February);
    EXPECT_EQ(CJulianDate(CDateTime(2.75)).GetValue(), 2u);
    EXPECT_EQ(CJulianDate(5).ToDateTime().GetValue(), 5.0);

    CJulianDate date(7);
    EXPECT_FALSE(date.SetDate(2024, 13, 1));
    EXPECT_EQ(date.GetValue(), 7u) << "a rejected date keeps the value";
    SYSTEMTIME noon = {};
    noon.wYear = 1900;
    noon.wMonth = 1;
    noon.wDay = 2;
    noon.wHour = 12;
    EXPECT_TRUE(date.FromSystemTime(noon));
    EXPECT_EQ(date.GetValue(), 3u);

    // A negative variant time keeps the low 32 bits of its truncation.
    CJulianDate negative;
    EXPECT_TRUE(negative.SetDate(-1.5));
    EXPECT_EQ(negative.GetValue(), 0xFFFFFFFFu);
    EXPECT_EQ(negative.ToDateTime().GetValue(), 4294967295.0);
    EXPECT_THROW(negative.ToSystemTime(), unexpected_error);
    EXPECT_THROW(negative.GetYear(), unexpected_error);
}

TEST(CJulianDateTest, MonthShiftsLimitFebruaryOnly) {
    CJulianDate date = Date(2024, 1, 31);
    date.AddMonths(1);
    ExpectDate(date, 2024, 2, 29);
    date = Date(2023, 1, 31);
    date.AddMonths(1);
    ExpectDate(date, 2023, 2, 28);
    date = Date(2024, 3, 31);
    date.AddMonths(-1);
    ExpectDate(date, 2024, 2, 29);
    date = Date(2024, 3, 15);
    date.AddMonths(-3);
    ExpectDate(date, 2023, 12, 15);
    date = Date(2024, 3, 15);
    date.AddMonths(12);
    ExpectDate(date, 2025, 3, 15);
    date = Date(2024, 1, 15);
    date.AddMonths(-13);
    ExpectDate(date, 2022, 12, 15);
    date = Date(2024, 12, 15);
    date.AddMonths(1);
    ExpectDate(date, 2025, 1, 15);
    // Other months keep the day, and the conversion rolls 31 April on.
    date = Date(2024, 1, 31);
    date.AddMonths(3);
    ExpectDate(date, 2024, 5, 1);
}

TEST(CJulianDateTest, YearShiftsAndTheirLimits) {
    CJulianDate date = Date(2024, 2, 29);
    date.AddYears(1);
    ExpectDate(date, 2025, 2, 28);
    date = Date(2024, 2, 29);
    date.AddYears(4);
    ExpectDate(date, 2028, 2, 29);

    // Beyond the calendar's range the date stays as it was.
    date = Date(9999, 6, 1);
    const DWORD before = date.GetValue();
    date.AddYears(1);
    EXPECT_EQ(date.GetValue(), before);
    date.AddMonths(12);
    EXPECT_EQ(date.GetValue(), before);
    EXPECT_THROW(date.AddMonths(12 * 32767), unexpected_error);
    date.AddMonths(-12 * 40000);
    EXPECT_EQ(date.GetValue(), before) << "a wrapped 16-bit year is refused";

    // Before 1900 a date-time shifts too; before the year 100 it stays,
    // rather than being read as a two-digit year.
    CDateTime early(100, 6, 1, 12, 0, 0);
    const double earlyValue = early.GetValue();
    early.AddYears(-1);
    EXPECT_EQ(early.GetValue(), earlyValue);
    early.AddMonths(-6);
    EXPECT_EQ(early.GetValue(), earlyValue);
    early.AddMonths(1);
    EXPECT_EQ(early, CDateTime(100, 7, 1, 12, 0, 0));
    // Days before 30 December 1899 wrap in the unsigned day number, which
    // has no calendar date.
    CJulianDate wrapped(100, 6, 1);
    EXPECT_THROW(wrapped.AddYears(1), unexpected_error);
}

TEST(CJulianDateTest, DaysSpansAndComparisons) {
    EXPECT_EQ(CJulianDate(5) - CJulianDate(6), CTimeSpan(-1.0));
    EXPECT_FALSE(CJulianDate(6) < CJulianDate(5));
    EXPECT_TRUE(CJulianDate(5) < CJulianDate(6));
    EXPECT_TRUE(CJulianDate(5) == CJulianDate(5));
    CJulianDate date(2);
    date += CTimeSpan(1.9);
    EXPECT_EQ(date.GetValue(), 3u) << "the part day is dropped";
    EXPECT_DOUBLE_EQ((CJulianDate(2) + CTimeSpan(0.5)).GetValue(), 2.5);
    EXPECT_EQ((CJulianDate(2) + CTime(0.5)).GetValue(), 2.5);
    date.AddDays(-4);
    EXPECT_EQ(date.GetValue(), 0xFFFFFFFFu);
    date.AddDays(1);
    EXPECT_TRUE(date.IsNull());
    EXPECT_EQ(CJulianDate::Now().GetValue(), CDateTime::Now().GetJulianDate());
}

TEST(CDateTimeTest, CalendarRules) {
    for (DWORD year : {2000u, 1600u, 2400u, 2024u})
        EXPECT_TRUE(CDateTime::IsLeapYear(year)) << year;
    for (DWORD year : {1900u, 2100u, 3000u, 2023u})
        EXPECT_FALSE(CDateTime::IsLeapYear(year)) << year;
    EXPECT_EQ(CDateTime::DaysInMonth(2024, February), 29);
    EXPECT_EQ(CDateTime::DaysInMonth(2023, 1), 28);
    EXPECT_EQ(CDateTime::DaysInMonth(2023, 12), 0);
    EXPECT_EQ(CDateTime::DaysInMonth(2023, -1), 0);
    EXPECT_EQ(CDateTime::DaysInMonth(2023, InvalidMonth), 0);
    EXPECT_EQ(CDateTime::DaysInMonthOneBased(2023, 13), 0);
    EXPECT_EQ(CDateTime::DaysInMonthOneBased(2023, 0), 0);
    EXPECT_EQ(CDateTime::DaysInMonthOneBased(2023, 4), 30);
    EXPECT_EQ(CDateTime::DaysInMonthOneBased(2023, 12), 31);
}

} // namespace
