#include <vaskel/calendar.h>

#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <memory>

using namespace vaskel;

TEST(CVKEnumHelper, ComparesAsSignedIntsAndSharesOneValueBetweenBothViews) {
    CVKEnumHelper<ECalendarMonth> month;
    CVKEnumHelper<ECalendarMonth> invalid(InvalidMonth);
    EXPECT_TRUE(month == January && invalid != month);
    EXPECT_TRUE(invalid < month && invalid < 0 && month > invalid && month > -1);

    month.GetValueRef() = March;
    EXPECT_EQ(month.GetIntRef(), 2);
    month.GetIntRef() = 42;
    const CVKEnumHelper<ECalendarMonth>& constant = month;
    EXPECT_EQ(constant.GetValueRef(), static_cast<ECalendarMonth>(42));
    EXPECT_TRUE(constant.Is(42) && constant == 42);
    month.Clear();
    EXPECT_TRUE(month == CVKEnumHelper<ECalendarMonth>(January));
}

TEST(CalendarMonthX, NamesAndConversionsMapOutOfRangeValuesToInvalid) {
    EXPECT_STREQ(CalendarMonthX::ToString(May, true), "May");
    EXPECT_STREQ(CalendarMonthX::ToString(May, false), "May");
    EXPECT_STREQ(CalendarMonthX(September).ToString(true), "September");
    EXPECT_STREQ(CalendarMonthX(December).ToString(false), "Dec");
    EXPECT_STREQ(CalendarMonthX::ToString(static_cast<ECalendarMonth>(12), true), "Invalid");
    EXPECT_STREQ(CalendarMonthX::ToString(InvalidMonth, false), "Inv");
    CalendarMonthX month;
    EXPECT_TRUE(month.IsJanuary());
    month.SetAsMay();
    EXPECT_TRUE(month.IsMay() && !month.IsJanuary() && month == May);

    const struct {
        int value;
        ECalendarMonth zeroBased, oneBased;
    } cases[] = {{INT_MIN, InvalidMonth, InvalidMonth},
                 {-1, InvalidMonth, InvalidMonth},
                 {0, January, InvalidMonth},
                 {1, February, January},
                 {11, December, November},
                 {12, InvalidMonth, December},
                 {13, InvalidMonth, InvalidMonth}};
    for (const auto& c : cases) {
        EXPECT_EQ(CalendarMonthX::GetMonth(c.value), c.zeroBased) << c.value;
        EXPECT_EQ(CalendarMonthX::GetMonthOneBased(c.value), c.oneBased) << c.value;
        if (c.value >= 0) {
            SYSTEMTIME time{};
            time.wMonth = static_cast<WORD>(c.value);
            EXPECT_EQ(CalendarMonthX::GetMonth(time), c.oneBased) << c.value;
        }
    }
}

TEST(DayOfWeekX, NamesGetDayAndNextVisitEachDayOnce) {
    EXPECT_STREQ(DayOfWeekX::ToString(Sunday, true), "Sunday");
    EXPECT_STREQ(DayOfWeekX(Wednesday).ToString(false), "Wed");
    EXPECT_STREQ(DayOfWeekX::ToString(static_cast<EDayOfWeek>(7), true), "Invalid");
    EXPECT_STREQ(DayOfWeekX::ToString(InvalidDay, false), "Inv");
    EXPECT_EQ(DayOfWeekX::GetDay(6), Saturday);
    EXPECT_EQ(DayOfWeekX::GetDay(7), InvalidDay);
    EXPECT_EQ(DayOfWeekX::GetDay(-2), InvalidDay);

    int visited = 0;
    for (EDayOfWeek d = DayOfWeekX::First(); d != InvalidDay; d = DayOfWeekX::Next(d))
        EXPECT_EQ(d, visited++);
    EXPECT_EQ(visited, 7);
    EXPECT_EQ(DayOfWeekX::Next(Saturday), InvalidDay);
    EXPECT_EQ(DayOfWeekX::Next(InvalidDay), Sunday);
    EXPECT_EQ(DayOfWeekX::Next(static_cast<EDayOfWeek>(INT_MAX)), InvalidDay);
    EXPECT_EQ(DayOfWeekX::Next(static_cast<EDayOfWeek>(-5)), InvalidDay);

    DayOfWeekX day;
    EXPECT_TRUE(day.IsSunday());
    day.SetAsThursday();
    EXPECT_TRUE(day.IsThursday() && day == 4);
}

TEST(DayOfWeekX, WholeTextMatchesAFullOrShortNameIgnoringCase) {
    const struct {
        const char* text;
        EDayOfWeek day;
    } cases[] = {{"thu", Thursday},       {"THURSDAY", Thursday},  {"Thurs", InvalidDay},
                 {"sAt", Saturday},       {"Sun ", InvalidDay},    {"", InvalidDay},
                 {"Sunday!", InvalidDay}, {"wednesday", Wednesday}};
    for (const auto& c : cases)
        EXPECT_EQ(DayOfWeekX::FromString(c.text), c.day) << c.text;
    EXPECT_EQ(DayOfWeekX::FromString(nullptr), InvalidDay);
}

TEST(DayOfWeekX, PrefixMatchesTheFirstDayAndReadsOnlyTheGivenBytes) {
    const struct {
        const char* text;
        DWORD length;
        EDayOfWeek day;
    } cases[] = {{"S", 1, Sunday},       {"Sa", 2, Saturday},      {"T", 1, Tuesday},
                 {"th", 2, Thursday},    {"Wedn", 4, Wednesday},   {"Thurs", 5, Thursday},
                 {"Sunday", 3, Sunday},  {"Sunxyz", 3, Sunday},    {"Satu", 4, Saturday},
                 {"Sat", 4, InvalidDay}, {"Friday", 10, Friday},   {"Fridays", 10, InvalidDay},
                 {"Mo", 3, InvalidDay},  {"Funday", 6, InvalidDay}};
    for (const auto& c : cases)
        EXPECT_EQ(DayOfWeekX::FromString(c.text, c.length), c.day) << c.text << "/" << c.length;
    EXPECT_EQ(DayOfWeekX::FromString(nullptr, 3), InvalidDay);

    // Unterminated text of exactly the given length: any read beyond it is a
    // sanitizer report.
    for (const char* name : {"Wed", "wednesday"}) {
        size_t length = std::strlen(name);
        std::unique_ptr<char[]> bytes(new char[length]);
        std::memcpy(bytes.get(), name, length);
        EXPECT_EQ(DayOfWeekX::FromString(bytes.get(), static_cast<DWORD>(length)), Wednesday);
    }
}

TEST(TimeResolutionX, DefaultsToNoResolutionAndEachSetterSetsItsCode) {
    TimeResolutionX resolution;
    EXPECT_TRUE(resolution == 0);
    EXPECT_FALSE(resolution.IsNanoSeconds() || resolution.IsInvalid());
    resolution.SetAsNanoSeconds();
    EXPECT_TRUE(resolution.IsNanoSeconds() && resolution == 20);
    resolution.SetAsDays();
    EXPECT_TRUE(resolution.IsDays() && resolution == 26);
    resolution.SetAsInvalid();
    EXPECT_TRUE(resolution.IsInvalid() && resolution < 0);
}

TEST(DaysOfWeek, BitsRunFromMondayToSunday) {
    EXPECT_EQ(DaysOfWeek::DayToBit(Sunday), 64);
    EXPECT_EQ(DaysOfWeek::DayToBit(Monday), 1);
    EXPECT_EQ(DaysOfWeek::DayToBit(Saturday), 32);
    EXPECT_EQ(DaysOfWeek::DayToBit(InvalidDay), 0);
    EXPECT_EQ(DaysOfWeek::DayToBit(static_cast<EDayOfWeek>(7)), 0);
    for (EDayOfWeek d = DayOfWeekX::First(); d != InvalidDay; d = DayOfWeekX::Next(d))
        EXPECT_EQ(DaysOfWeek::BitToDay(DaysOfWeek::DayToBit(d)), d);
    for (int bits : {0, 3, 96, 128, 127, -1, INT_MIN})
        EXPECT_EQ(DaysOfWeek::BitToDay(bits), InvalidDay) << bits;
}

TEST(DaysOfWeek, SetOperationsAndText) {
    DaysOfWeek days;
    EXPECT_STREQ(days.ToString(), "");
    days.AddSunday();
    EXPECT_STREQ(days.ToString(), "(Sunday)");
    EXPECT_TRUE(days.IsSunday() && days.HasSunday() && !days.IsAllDays());
    days.AddDay(InvalidDay);
    days.RemoveDay(InvalidDay);
    EXPECT_TRUE(days.IsSunday() && days.HasDay(InvalidDay));
    days.SetFriday(true);
    days.AddDay(Monday);
    EXPECT_STREQ(days.ToString(), "(Monday,Friday,Sunday)");
    EXPECT_FALSE(days.IsSunday() || days.HasAllDays());
    days.AddAllDays();
    EXPECT_TRUE(days.IsAllDays() && days.HasDay(Wednesday));
    EXPECT_STREQ(days.ToString(), "(Monday,Tuesday,Wednesday,Thursday,Friday,Saturday,Sunday)");
    days.SetDay(Wednesday, false);
    days.RemoveSaturday();
    EXPECT_FALSE(days.HasAllDays() || days.HasWednesday() || days.HasSaturday());
    DaysOfWeek copy = days;
    copy.SetAllDays(false);
    EXPECT_STREQ(copy.ToString(), "");
    EXPECT_STREQ(days.ToString(), "(Monday,Tuesday,Thursday,Friday,Sunday)");
}

TEST(DaysOfWeek, ReadsItsOwnTextAndLooserLists) {
    const struct {
        const char* text;
        const char* days;
    } cases[] = {
        {"(Monday,Friday)", "(Monday,Friday)"},
        {"Mon, Funday, Fri", "(Monday,Friday)"},
        {"Mon Tue", "(Monday,Tuesday)"},
        {"mon,tue", "(Monday,Tuesday)"},
        {"(Mo;Tu)", "(Monday,Tuesday)"},
        {"  ( sunday , SAT ) ", "(Saturday,Sunday)"},
        {"S T W", "(Tuesday,Wednesday,Sunday)"},
        {"Monday,,Friday", "(Monday)"},
        {"Mondays,Wed1Thu", "(Wednesday,Thursday)"},
        {"", ""},
        {"(, )", ""},
        {"((Monday)", ""},
    };
    for (const auto& c : cases) {
        DaysOfWeek days;
        days.AddAllDays();
        days.FromString(c.text);
        EXPECT_STREQ(days.ToString(), c.days) << c.text;
    }
    DaysOfWeek days;
    days.AddMonday();
    days.FromString(nullptr);
    EXPECT_STREQ(days.ToString(), "");

    for (int mask = 0; mask < 128; ++mask) {
        DaysOfWeek original;
        for (int bit = 1; bit < 128; bit <<= 1) {
            if (mask & bit)
                original.AddDay(DaysOfWeek::BitToDay(bit));
        }
        DaysOfWeek read;
        read.FromString(original.ToString());
        EXPECT_STREQ(read.ToString(), original.ToString()) << mask;
    }
}
