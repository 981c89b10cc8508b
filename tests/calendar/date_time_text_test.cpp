// Tests of the text forms of dates and times: strftime-style formats and
// their check, the platform's locale text and parsing, and the fallbacks.
#include <vaskel/calendar.h>
#include <vaskel/diag.h>
#include <vaskel/framework/exceptions.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

using namespace vaskel;

namespace {

const CDateTime leapDay(2024, 2, 29, 13, 45, 10);

std::string Text(const CString& text) {
    return std::string(text.GetString(), static_cast<size_t>(text.GetLength()));
}

TEST(DateTimeFormat, NumericAndNameCodes) {
    EXPECT_EQ(Text(leapDay.Format("%Y-%m-%d %H:%M:%S")), "2024-02-29 13:45:10");
    EXPECT_EQ(Text(leapDay.Format("%a %A %b %B %p")), "Thu Thursday Feb February PM");
    EXPECT_EQ(Text(leapDay.Format("%I %j %w %U %W %y")), "01 060 4 08 09 24");
    EXPECT_EQ(Text(leapDay.Format("%X")), "13:45:10");
    EXPECT_EQ(Text(leapDay.Format("100%% at %H")), "100% at 13");
    EXPECT_EQ(Text(leapDay.Format("no codes")), "no codes");
    // Day of the year counts the leap day.
    EXPECT_EQ(Text(CDateTime(2024, 12, 31, 0, 0, 0).Format("%j")), "366");
    EXPECT_EQ(Text(CDateTime(2023, 12, 31, 0, 0, 0).Format("%j")), "365");
}

TEST(DateTimeFormat, HashFlagDropsLeadingZeros) {
    const CDateTime early(2005, 3, 7, 5, 0, 9);
    EXPECT_EQ(Text(early.Format("%#d/%#m/%#y %#H:%#M:%#S")), "7/3/5 5:0:9");
    EXPECT_EQ(Text(early.Format("%#j %#I")), "66 5");
    EXPECT_EQ(Text(early.Format("%#Y")), "2005");
    EXPECT_EQ(Text(early.Format("%#a %#B")), "Mon March") << "ignored for names";
}

TEST(DateTimeFormat, TimeOfDayShowsTheNullDate) {
    EXPECT_EQ(Text(CTime(0.5).Format("%Y-%m-%d %H")), "1899-12-30 12");
    EXPECT_EQ(Text(CJulianDate(2).Format("%d %B %Y %H:%M")), "01 January 1900 00:00");
}

TEST(DateTimeFormat, InvalidValuesAndCodes) {
    EXPECT_EQ(Text(CDateTime(-657435.0).Format("%Y")), "Invalid DateTime");
    EXPECT_EQ(Text(CDateTime(1e300).Format(0, LOCALE_USER_DEFAULT)), "Invalid DateTime");
    // A code outside the list never reaches the runtime.
    EXPECT_EQ(Text(leapDay.Format("%q%Y%")), "%q2024%");
    EXPECT_EQ(Text(leapDay.TryFormat("%q")), "");
    EXPECT_EQ(Text(leapDay.TryFormat("%Y")), "2024");
    EXPECT_EQ(Text(leapDay.TryFormat(nullptr)), "");
    // Output stops at 255 characters.
    std::string longFormat(100, 'x');
    for (int i = 0; i < 20; ++i)
        longFormat += "%B";
    EXPECT_EQ(leapDay.Format(longFormat.c_str()).GetLength(), 255);
}

TEST(DateTimeFormat, ValidFormatString) {
    for (const char* valid : {"%Y-%m-%d", "%#d", "100%%", "plain", "%%%Y", "%#c %#x %z %Z"})
        EXPECT_TRUE(CDateTime::ValidFormatString(valid)) << valid;
    for (const char* invalid : {"", "%", "%#", "%q", "%E", "%Y%", "%##d", "%-d"})
        EXPECT_FALSE(CDateTime::ValidFormatString(invalid)) << invalid;
    EXPECT_FALSE(CDateTime::ValidFormatString(nullptr));
}

TEST(DateTimeFormat, MissingResourceThrowsTheOleException) {
    try {
        leapDay.Format(UINT{1234});
        FAIL() << "no string resource";
    } catch (const COleException& e) {
        EXPECT_EQ(e.m_sc, E_FAIL);
    }
    EXPECT_THROW(CTime(0.5).Format(UINT{1}), COleException);
}

TEST(DateTimeText, LocaleTextOfTheUserDefault) {
    EXPECT_EQ(Text(leapDay.ToString()), "2/29/2024 1:45:10 PM");
    EXPECT_EQ(Text(CDateTime(45351.0).ToString()), "2/29/2024");
    EXPECT_EQ(Text(leapDay.Format(VAR_DATEVALUEONLY, LOCALE_USER_DEFAULT)), "2/29/2024");
    EXPECT_EQ(Text(leapDay.Format(VAR_TIMEVALUEONLY, LOCALE_USER_DEFAULT)), "1:45:10 PM");
    EXPECT_EQ(Text(CJulianDate(2).ToString()), "1/1/1900");
    EXPECT_EQ(Text(CTime(0.75).ToString()), "6:00:00 PM");
}

TEST(DateTimeText, ParsingChangesTheValueOnlyOnSuccess) {
    CDateTime value(7.5);
    EXPECT_FALSE(value.FromString("not a date"));
    EXPECT_FALSE(value.FromString(nullptr));
    EXPECT_FALSE(value.FromString(""));
    EXPECT_EQ(value.GetValue(), 7.5);
    EXPECT_TRUE(value.FromString("2/29/2024 1:45:10 PM"));
    EXPECT_EQ(value, leapDay);
    EXPECT_TRUE(value.ParseDateTime("2024-02-29 13:45:10", VAR_DATEVALUEONLY, LOCALE_USER_DEFAULT));
    EXPECT_EQ(value.GetValue(), 45351.0);

    CJulianDate date(9);
    EXPECT_TRUE(date.FromString("2/29/2024 1:45:10 PM"));
    EXPECT_EQ(date.GetValue(), 45351u);
    EXPECT_FALSE(date.FromString("31/31/2024"));
    EXPECT_EQ(date.GetValue(), 45351u);
    EXPECT_EQ(CJulianDate::Parse("1/1/1900", 0, LOCALE_USER_DEFAULT).GetValue(), 2u);
    EXPECT_THROW(CJulianDate::Parse("never", 0, LOCALE_USER_DEFAULT), unexpected_error);

    CTime time;
    EXPECT_TRUE(time.FromString("6:00 PM"));
    EXPECT_EQ(time.GetValue(), 0.75);
    EXPECT_TRUE(time.FromString("12/29/1899 6:00:00 AM"));
    EXPECT_EQ(time.GetValue(), 0.25) << "the time of day of a date before the epoch";
    EXPECT_FALSE(time.FromString("25:00"));
    EXPECT_EQ(time.GetValue(), 0.25);
}

TEST(DateTimeText, ToStringParsesBackAtOneSecondResolution) {
    std::mt19937_64 random(8);
    std::uniform_int_distribution<long long> anyDay(-657434, 2958465);
    std::uniform_int_distribution<int> anySecond(0, 86399);
    for (int i = 0; i < 3000; ++i) {
        const long long day = anyDay(random);
        const int second = anySecond(random);
        const double fraction = second / 86400.0;
        const CDateTime value(day >= 0 ? day + fraction : day - fraction);
        CDateTime parsed;
        ASSERT_TRUE(parsed.FromString(value.ToString())) << Text(value.ToString());
        ASSERT_EQ(CDateTime::CompareToMilisecondResolution(parsed, value), 0)
            << Text(value.ToString()) << " gave " << parsed.GetValue() << " for "
            << value.GetValue();
    }
}

} // namespace
