// Variant dates as text and back: VarBstrFromDate and VarDateFromStr. On
// Windows the functions are the system's, so every case that Windows and
// vaskel agree on runs there too.
#include "support/wine.h"

#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>
#include <string>

namespace {

using OleString = std::basic_string<OLECHAR>;

constexpr LCID kEnglishUs = 0x409;
constexpr LCID kLocales[] = {kEnglishUs, LOCALE_USER_DEFAULT, LOCALE_SYSTEM_DEFAULT, LOCALE_NEUTRAL,
                             LOCALE_INVARIANT};
constexpr double kSecond = 1.0 / 86400;

// A few rules of vaskel's own are stricter or wider than Windows': their
// checks run against vaskel alone.
#ifdef _WIN32
constexpr bool kOwnImplementation = false;
#else
constexpr bool kOwnImplementation = true;
#endif

// The variant time of a day number and a time of day in seconds.
DATE At(long long day, double seconds) {
    return day >= 0 ? day + seconds * kSecond : day - seconds * kSecond;
}

DATE At(long long day, int hour, int minute, int second) {
    return At(day, hour * 3600.0 + minute * 60 + second);
}

constexpr long long kLeapDay2024 = 45351;

// The nearest whole second counted from 30 December 1899: equal for values
// that print the same, such as 0.25 and -0.25.
long long SecondOf(DATE value) {
    const double day = std::trunc(value);
    return static_cast<long long>(day) * 86400 + std::llround(std::fabs(value - day) * 86400);
}

OleString Ole(const std::string& ascii) {
    return OleString(ascii.begin(), ascii.end());
}

struct Formatted {
    HRESULT hr;
    std::string text;
};

Formatted Format(DATE value, LCID lcid = kEnglishUs, ULONG flags = 0) {
    BSTR text = nullptr;
    Formatted result{VarBstrFromDate(value, lcid, flags, &text), {}};
    for (UINT i = 0; text && i < SysStringLen(text); ++i)
        result.text += text[i] < 0x80 ? static_cast<char>(text[i]) : '?';
    SysFreeString(text);
    return result;
}

struct Parsed {
    HRESULT hr;
    DATE value;
};

Parsed Parse(OleString text, LCID lcid = kEnglishUs, ULONG flags = 0) {
    DATE value = -1e9;
    const HRESULT hr = VarDateFromStr(&text[0], lcid, flags, &value);
    return {hr, value};
}

Parsed Parse(const std::string& text, LCID lcid = kEnglishUs, ULONG flags = 0) {
    return Parse(Ole(text), lcid, flags);
}

struct TextAndValue {
    const char* text;
    DATE value;
};

template <size_t N>
void ExpectParses(const TextAndValue (&cases)[N], LCID lcid = kEnglishUs, ULONG flags = 0) {
    for (const TextAndValue& c : cases) {
        const Parsed parsed = Parse(c.text, lcid, flags);
        EXPECT_EQ(parsed.hr, S_OK) << c.text;
        EXPECT_NEAR(parsed.value, c.value, kSecond / 1000) << c.text;
    }
}

void ExpectRefused(std::initializer_list<const char*> texts, HRESULT expected) {
    for (const char* text : texts)
        EXPECT_EQ(Parse(text).hr, expected) << text;
}

} // namespace

TEST(DateTextTest, PrintsBothLayoutsAndReadsThemBack) {
    const struct {
        DATE value;
        const char* englishUs;
        const char* invariant;
    } cases[] = {
        {At(kLeapDay2024, 13, 45, 10), "2/29/2024 1:45:10 PM", "02/29/2024 13:45:10"},
        {At(kLeapDay2024, 0, 0, 1), "2/29/2024 12:00:01 AM", "02/29/2024 00:00:01"},
        {At(kLeapDay2024, 12, 0, 0), "2/29/2024 12:00:00 PM", "02/29/2024 12:00:00"},
        {At(kLeapDay2024, 9, 5, 7), "2/29/2024 9:05:07 AM", "02/29/2024 09:05:07"},
        {3.34, "1/2/1900 8:09:36 AM", "01/02/1900 08:09:36"},
        {0.0, "12:00:00 AM", "00:00:00"},
        {0.25, "6:00:00 AM", "06:00:00"},
        {-0.25, "6:00:00 AM", "06:00:00"}, // day 0 either side of zero
        {1.0, "12/31/1899", "12/31/1899"},
        {365.0, "12/30/1900", "12/30/1900"},
        {-1.0, "12/29/1899", "12/29/1899"},
        {-1.25, "12/29/1899 6:00:00 AM", "12/29/1899 06:00:00"}, // the fraction counts forward
        {-49192.24, "4/24/1765 5:45:36 AM", "04/24/1765 05:45:36"},
        {-657434.0, "1/1/100", "01/01/100"},
        {At(-657434, 12, 0, 0), "1/1/100 12:00:00 PM", "01/01/100 12:00:00"},
        {At(2958465, 23, 59, 59), "12/31/9999 11:59:59 PM", "12/31/9999 23:59:59"},
        {At(kLeapDay2024, 13 * 3600 + 45 * 60 + 10.4), "2/29/2024 1:45:10 PM",
         "02/29/2024 13:45:10"},
        {At(kLeapDay2024, 13 * 3600 + 45 * 60 + 10.6), "2/29/2024 1:45:11 PM",
         "02/29/2024 13:45:11"}};
    // Each text reads back, in every locale, to the value's second.
    const auto expectReadsBack = [](const char* text, DATE value, LCID lcid) {
        const Parsed parsed = Parse(text, lcid);
        EXPECT_EQ(parsed.hr, S_OK) << text << " in " << lcid;
        EXPECT_EQ(SecondOf(parsed.value), SecondOf(value)) << text << " in " << lcid;
    };
    for (const auto& c : cases) {
        for (LCID lcid : kLocales) {
            const bool invariant = lcid == LOCALE_INVARIANT;
            EXPECT_EQ(Format(c.value, lcid).text, invariant ? c.invariant : c.englishUs)
                << c.value << " in " << lcid;
            expectReadsBack(c.englishUs, c.value, lcid);
            expectReadsBack(c.invariant, c.value, lcid);
        }
        EXPECT_EQ(Format(c.value, kEnglishUs, LOCALE_NOUSEROVERRIDE).text, c.englishUs);
    }
}

TEST(DateTextTest, FlagsPrintOnlyTheDateOrOnlyTheTime) {
    const DATE value = At(kLeapDay2024, 13, 45, 10);
    EXPECT_EQ(Format(value, kEnglishUs, VAR_DATEVALUEONLY).text, "2/29/2024");
    EXPECT_EQ(Format(value, kEnglishUs, VAR_TIMEVALUEONLY).text, "1:45:10 PM");
    EXPECT_EQ(Format(value, LOCALE_INVARIANT, VAR_TIMEVALUEONLY).text, "13:45:10");
    EXPECT_EQ(Format(-1.25, kEnglishUs, VAR_DATEVALUEONLY).text, "12/29/1899");
    EXPECT_EQ(Format(-1.25, kEnglishUs, VAR_TIMEVALUEONLY).text, "6:00:00 AM");
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine prints an empty text for a part the value alone would not show, "
                        "and for both flags at once";
    EXPECT_EQ(Format(0.5, kEnglishUs, VAR_DATEVALUEONLY).text, "12/30/1899");
    EXPECT_EQ(Format(2.0, kEnglishUs, VAR_TIMEVALUEONLY).text, "12:00:00 AM");
    EXPECT_EQ(Format(value, kEnglishUs, VAR_DATEVALUEONLY | VAR_TIMEVALUEONLY).hr, E_INVALIDARG);
}

TEST(DateTextTest, FormatRefusesValuesOutOfRangeAndBadArguments) {
    const double infinity = std::numeric_limits<double>::infinity();
    for (DATE value : {-657435.0, 2958466.0, infinity, -infinity})
        EXPECT_EQ(Format(value).hr, E_INVALIDARG) << value;
    EXPECT_EQ(VarBstrFromDate(1.0, kEnglishUs, 0, nullptr), E_INVALIDARG);
    // No Windows knows these locale identifiers.
    for (LCID lcid : {0x12345u, 0x80000409u})
        EXPECT_EQ(Format(1.0, lcid).hr, E_INVALIDARG) << lcid;
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine formats NaN as 12/30/1899, rounds the last second of 9999 up "
                        "into year 10000, and prints a time alone for a value that rounds up "
                        "to midnight of day 1";
    EXPECT_EQ(Format(std::nan("")).hr, E_INVALIDARG);
    EXPECT_EQ(Format(2958465.999999).hr, E_INVALIDARG);
    EXPECT_EQ(Format(1.0 - kSecond / 1000).text, "12/31/1899");
    EXPECT_EQ(Format(-1.0 - kSecond / 1000).text, "12/29/1899");
    if (!kOwnImplementation)
        GTEST_SKIP() << "Windows formats every installed locale";
    for (LCID lcid : {0x407u, 0x809u, 0x10409u})
        EXPECT_EQ(Format(1.0, lcid).hr, E_INVALIDARG) << lcid;
}

TEST(DateTextTest, RandomValuesRoundTripToTheSecond) {
    std::mt19937_64 random(20240229);
    std::uniform_int_distribution<long long> days(-657434, 2958465);
    std::uniform_int_distribution<int> seconds(0, 86399);
    std::uniform_real_distribution<double> belowHalf(0.0, 0.45);
    for (int i = 0; i < 1000; ++i) {
        const long long day = days(random);
        const int second = seconds(random);
        const DATE value = At(day, second + belowHalf(random));
        for (LCID lcid : {kEnglishUs, LCID{LOCALE_INVARIANT}}) {
            const Formatted formatted = Format(value, lcid);
            ASSERT_EQ(formatted.hr, S_OK) << value;
            const Parsed parsed = Parse(formatted.text, lcid);
            ASSERT_EQ(parsed.hr, S_OK) << formatted.text;
            EXPECT_EQ(SecondOf(parsed.value), SecondOf(value)) << formatted.text;
        }
    }
}

TEST(DateTextTest, ReadsIsoDatesAndDateTimes) {
    const TextAndValue cases[] = {{"2024-02-29", kLeapDay2024},
                                  {"2024-02-29 13:45", At(kLeapDay2024, 13, 45, 0)},
                                  {"2024-02-29 13:45:10", At(kLeapDay2024, 13, 45, 10)}};
    ExpectParses(cases);
    // Fractions of a second and time zones are refused, as the system does.
    ExpectRefused({"2024-02-29 13:45:10.5", "2024-02-29T13:45:10Z", "2024-02-29T13:45:10+01:00",
                   "2024-02-29T", "2/29/2024T13:45"},
                  DISP_E_TYPEMISMATCH);
    if (!kOwnImplementation)
        GTEST_SKIP() << "Wine refuses the ISO 'T' between date and time";
    const TextAndValue extended[] = {{"2024-02-29T13:45:10", At(kLeapDay2024, 13, 45, 10)},
                                     {"2024-02-29T13:45", At(kLeapDay2024, 13, 45, 0)}};
    ExpectParses(extended);
}

TEST(DateTextTest, ReadsMonthAndWeekdayNamesInAnyCase) {
    const TextAndValue cases[] = {{"February 29, 2024", kLeapDay2024},
                                  {"Feb 29 2024", kLeapDay2024},
                                  {"29 February 2024", kLeapDay2024},
                                  {"29 Feb, 2024", kLeapDay2024},
                                  {"29-Feb-2024", kLeapDay2024},
                                  {"29-FEB-2024", kLeapDay2024},
                                  {"FEBRUARY 29,2024", kLeapDay2024},
                                  {"Thursday, February 29, 2024", kLeapDay2024},
                                  {"thu Feb 29 2024", kLeapDay2024},
                                  {"Thursday 2/29/2024", kLeapDay2024},
                                  {"Feb 29, 2024 1:45 PM", At(kLeapDay2024, 13, 45, 0)},
                                  {"May 1 2024", 45413},
                                  {"Sep 1 2024", 45536},
                                  {"31-dec-1999", 36525},
                                  {"1 January 2000", 36526}};
    ExpectParses(cases);
    ExpectRefused({"Sept 1 2024", "Febr 29 2024", "Thursday", "Feb 30 2024", "Feb 29 2023"},
                  DISP_E_TYPEMISMATCH);
}

TEST(DateTextTest, ReadsTimesAlone) {
    const TextAndValue cases[] = {{"13:45", At(0, 13, 45, 0)},
                                  {"13:45:10", At(0, 13, 45, 10)},
                                  {"1:45 PM", At(0, 13, 45, 0)},
                                  {"1:45pm", At(0, 13, 45, 0)},
                                  {"1:45 pM", At(0, 13, 45, 0)},
                                  {"1 PM", At(0, 13, 0, 0)},
                                  {"1 am", At(0, 1, 0, 0)},
                                  {"12 AM", 0.0},
                                  {"12:30 AM", At(0, 0, 30, 0)},
                                  {"12 PM", 0.5},
                                  {"00:00 pm", 0.5},
                                  {"23:59:59", At(0, 23, 59, 59)}};
    ExpectParses(cases);
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine reads past the terminating NUL after a lone 'a' or 'p'";
    const TextAndValue oneLetter[] = {{"12:59 p", At(0, 12, 59, 0)}, {"9:05:07 a", At(0, 9, 5, 7)}};
    ExpectParses(oneLetter);
}

TEST(DateTextTest, TwoDigitYearsFallIn1930To2029) {
    const TextAndValue cases[] = {
        {"1/1/00", 36526}, {"1/1/29", 47119}, {"12/31/99", 36525}, {"2/29/24", kLeapDay2024}};
    ExpectParses(cases);
    ExpectRefused({"2/29/30"}, DISP_E_TYPEMISMATCH); // neither 1930 nor 2030 has a leap day
    if (vaskel_test::RunningOnWine())
        GTEST_SKIP() << "Wine 8 reads 30-49 as 2030-2049; Windows' window ends with 2029";
    const TextAndValue thirty[] = {{"1/1/30", 10959}};
    ExpectParses(thirty);
}

TEST(DateTextTest, SkipsBlanksAroundAndBetweenFields) {
    const DATE value = At(kLeapDay2024, 13, 45, 0);
    for (OLECHAR blank : {u' ', u'\t', u'\u00a0', u'\u3000'}) {
        const OleString text = OleString(2, blank) + Ole("2/29/2024") + blank + Ole("1:45") +
                               blank + Ole("PM") + OleString(2, blank);
        const Parsed parsed = Parse(text);
        EXPECT_EQ(parsed.hr, S_OK) << static_cast<int>(blank);
        EXPECT_NEAR(parsed.value, value, kSecond / 1000) << static_cast<int>(blank);
    }
}

TEST(DateTextTest, FlagsKeepOnlyOnePartOfTheValue) {
    const TextAndValue timeOnly[] = {{"2/29/2024 1:45:10 PM", At(0, 13, 45, 10)},
                                     {"12/29/1899 6:00:00 AM", 0.25},
                                     {"2/29/2024", 0.0}};
    ExpectParses(timeOnly, kEnglishUs, VAR_TIMEVALUEONLY);
    const TextAndValue dateOnly[] = {
        {"2/29/2024 1:45:10 PM", kLeapDay2024}, {"12/29/1899 6:00:00 AM", -1.0}, {"1:45 PM", 0.0}};
    ExpectParses(dateOnly, kEnglishUs, VAR_DATEVALUEONLY);
    EXPECT_EQ(Parse("2/29/2024", kEnglishUs, VAR_DATEVALUEONLY | VAR_TIMEVALUEONLY).hr,
              E_INVALIDARG);
}

TEST(DateTextTest, RefusesMalformedTextAndFieldsOutOfRange) {
    ExpectRefused({"", "   ", "abc", "True", "0", "1", "13", "1;2;3", "(1:2)", "2/30/2024",
                   "2/29/2023", "24:00", "23:60", "23:59:60", "0:60", "2/29/2024 25:00",
                   "2/29/2024 1:45:10 PM extra", "1/1/10000 x"},
                  DISP_E_TYPEMISMATCH);
    DATE value = 0.0;
    EXPECT_EQ(VarDateFromStr(nullptr, kEnglishUs, 0, &value), DISP_E_TYPEMISMATCH);
    if (!vaskel_test::RunningOnWine()) // Wine reads 0.0 as midnight, Windows refuses it
        ExpectRefused({"0.0"}, DISP_E_TYPEMISMATCH);
    // A first number past 12 is the day, and AM/PM after an hour past 12
    // changes nothing.
    const TextAndValue systemReadings[] = {{"13/1/2024", 45304},
                                           {"13-1-2024", 45304},
                                           {"13:00 AM", At(0, 13, 0, 0)},
                                           {"13:00 PM", At(0, 13, 0, 0)}};
    ExpectParses(systemReadings);
    ExpectRefused({"13/13/2024", "32/1/2024"}, DISP_E_TYPEMISMATCH);
    if (!kOwnImplementation)
        GTEST_SKIP() << "Windows reads 2.5 as 2:05 and 1 2 as 2 January of this year";
    ExpectRefused(
        {"2.5", "1 2", "Feb 29", "1/0000000001/2024", "002/29/2024", "1:45:10 PM 2/29/2024"},
        DISP_E_TYPEMISMATCH);
    const OleString text = Ole("2/29/2024 13:45");
    const OleString letters(100000, u'x');
    EXPECT_EQ(Parse(text + letters).hr, DISP_E_TYPEMISMATCH);
}

TEST(DateTextTest, YearsOutsideTheRangeOverflow) {
    if (!kOwnImplementation)
        GTEST_SKIP() << "the system decides (Wine: a type mismatch, and 099 is 1999)";
    ExpectRefused(
        {"1/1/10000", "10000-01-01", "Jan 1 12345", "1/1/099", "0099-01-01", "1/1/1234567890123"},
        DISP_E_OVERFLOW);
    EXPECT_EQ(Parse("1/1/" + std::string(100000, '9')).hr, DISP_E_OVERFLOW);
}

TEST(DateTextTest, ParseRefusesBadArguments) {
    if (!kOwnImplementation)
        GTEST_SKIP() << "the system decides (Wine writes through a null result and reads text "
                        "in any locale)";
    EXPECT_EQ(VarDateFromStr(&Ole("1/1/2000")[0], kEnglishUs, 0, nullptr), E_INVALIDARG);
    DATE untouched = 7.5;
    EXPECT_EQ(VarDateFromStr(&Ole("2/30/2024")[0], kEnglishUs, 0, &untouched), DISP_E_TYPEMISMATCH);
    EXPECT_EQ(untouched, 7.5);
    for (LCID lcid : {0x12345u, 0x80000409u})
        EXPECT_EQ(Parse("1/1/2000", lcid).hr, E_INVALIDARG) << lcid;
}
