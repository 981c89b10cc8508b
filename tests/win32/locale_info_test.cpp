// Locale information: the exact en-US values, the invariant locale's, the
// defaults, and the size and failure rules every query follows.
#include <vaskel/win32.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>

namespace {

constexpr LCID kEnglishUs = 0x0409;
const DWORD untouched = 0xDEADBEEF; // set before a call whose last error is checked

struct Value {
    LCTYPE type;
    const char* text;
};

// The answer and the result, which counts the NUL; empty with the error on failure.
std::string Query(LCID locale, LCTYPE type) {
    char text[256];
    const int result = GetLocaleInfoA(locale, type, text, sizeof text);
    if (result == 0)
        return "(failed " + std::to_string(GetLastError()) + ")";
    EXPECT_EQ(static_cast<std::size_t>(result), std::strlen(text) + 1) << type;
    return text;
}

const Value kEnglishUsValues[] = {
    {LOCALE_SENGCURRNAME, "US Dollar"},
    {LOCALE_SCURRENCY, "$"},
    {LOCALE_SINTLSYMBOL, "USD"},
    {LOCALE_SDECIMAL, "."},
    {LOCALE_STHOUSAND, ","},
    {LOCALE_SGROUPING, "3;0"},
    {LOCALE_SNEGATIVESIGN, "-"},
    {LOCALE_SPOSITIVESIGN, ""},
    {LOCALE_SENGLANGUAGE, "English"},
    {LOCALE_SENGCOUNTRY, "United States"},
    {LOCALE_SNATIVELANGNAME, "English"},
    {LOCALE_SISO639LANGNAME, "en"},
    {LOCALE_SISO3166CTRYNAME, "US"},
    {LOCALE_SNAME, "en-US"},
    {LOCALE_ILANGUAGE, "0409"},
    {LOCALE_IDEFAULTANSICODEPAGE, "1252"},
    {LOCALE_IDEFAULTCODEPAGE, "437"},
    {LOCALE_SSHORTDATE, "M/d/yyyy"},
    {LOCALE_SLONGDATE, "dddd, MMMM d, yyyy"},
    {LOCALE_STIMEFORMAT, "h:mm:ss tt"},
    {LOCALE_SDATE, "/"},
    {LOCALE_STIME, ":"},
    {LOCALE_S1159, "AM"},
    {LOCALE_S2359, "PM"},
};

const char* const kDays[] = {"Monday", "Tuesday",  "Wednesday", "Thursday",
                             "Friday", "Saturday", "Sunday"};
const char* const kMonths[] = {"January",   "February", "March",    "April",
                               "May",       "June",     "July",     "August",
                               "September", "October",  "November", "December"};

} // namespace

TEST(LocaleInfo, EnglishUsValuesAreExact) {
    for (const Value& value : kEnglishUsValues)
        EXPECT_EQ(Query(kEnglishUs, value.type), value.text) << std::hex << value.type;
    // An override of the user's settings changes nothing for a named locale.
    EXPECT_EQ(Query(kEnglishUs, LOCALE_SSHORTDATE | LOCALE_NOUSEROVERRIDE), "M/d/yyyy");
}

TEST(LocaleInfo, DayAndMonthNamesRunFromMondayAndJanuary) {
    for (LCTYPE i = 0; i < 7; ++i) {
        EXPECT_EQ(Query(kEnglishUs, LOCALE_SDAYNAME1 + i), kDays[i]);
        EXPECT_EQ(Query(kEnglishUs, LOCALE_SABBREVDAYNAME1 + i), std::string(kDays[i], 3));
    }
    for (LCTYPE i = 0; i < 12; ++i) {
        EXPECT_EQ(Query(kEnglishUs, LOCALE_SMONTHNAME1 + i), kMonths[i]);
        EXPECT_EQ(Query(kEnglishUs, LOCALE_SABBREVMONTHNAME1 + i), std::string(kMonths[i], 3));
    }
}

TEST(LocaleInfo, DefaultsAgreeWithEnglishUsWhenThatIsTheUsersLocale) {
    for (LCID locale :
         {LCID{LOCALE_USER_DEFAULT}, LCID{LOCALE_SYSTEM_DEFAULT}, LCID{LOCALE_NEUTRAL}}) {
        char name[32];
        ASSERT_GT(GetLocaleInfoA(locale, LOCALE_SNAME, name, sizeof name), 0) << locale;
        if (std::strcmp(name, "en-US") != 0)
            continue; // another machine's locale; only that it answers is checked
        for (const Value& value : kEnglishUsValues)
            EXPECT_EQ(Query(locale, value.type), value.text) << locale << " " << value.type;
    }
}

TEST(LocaleInfo, InvariantLocaleHasItsOwnValues) {
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SENGLANGUAGE), "Invariant Language");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SENGCOUNTRY), "Invariant Country");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SNAME), "");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_ILANGUAGE), "007f");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SINTLSYMBOL), "XDR");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SPOSITIVESIGN), "+");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SSHORTDATE), "MM/dd/yyyy");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SLONGDATE), "dddd, dd MMMM yyyy");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_STIMEFORMAT), "HH:mm:ss");
    EXPECT_EQ(Query(LOCALE_INVARIANT, LOCALE_SMONTHNAME1), "January");
}

TEST(LocaleInfo, SizeZeroAsksForTheSizeAndTooSmallFails) {
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGCOUNTRY, nullptr, 0), 14);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SPOSITIVESIGN, nullptr, 0), 1);

    char text[14];
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGCOUNTRY, text, 14), 14);
    EXPECT_STREQ(text, "United States");
    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGCOUNTRY, text, 13), 0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER));
}

TEST(LocaleInfo, NumbersComeAsADwordWhenAsked) {
    DWORD number = 0;
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_IDEFAULTANSICODEPAGE | LOCALE_RETURN_NUMBER,
                             reinterpret_cast<LPSTR>(&number), sizeof number),
              static_cast<int>(sizeof number));
    EXPECT_EQ(number, 1252u);
    // The language is written in hexadecimal, and read so.
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_ILANGUAGE | LOCALE_RETURN_NUMBER,
                             reinterpret_cast<LPSTR>(&number), sizeof number),
              static_cast<int>(sizeof number));
    EXPECT_EQ(number, 0x409u);

    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_IDEFAULTCODEPAGE | LOCALE_RETURN_NUMBER,
                             reinterpret_cast<LPSTR>(&number), 2),
              0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INSUFFICIENT_BUFFER));
    // Text has no number.
    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGLANGUAGE | LOCALE_RETURN_NUMBER,
                             reinterpret_cast<LPSTR>(&number), sizeof number),
              0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_FLAGS));
}

TEST(LocaleInfo, UnknownLocalesTypesAndBadBuffersFail) {
    char text[64];
    for (LCID locale : {LCID{0x9999}, LCID{0x12345}, LCID{0x10409}, LCID{0xFFFFFFFF}}) {
        SetLastError(untouched);
        EXPECT_EQ(GetLocaleInfoA(locale, LOCALE_SENGLANGUAGE, text, sizeof text), 0) << locale;
        EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER)) << locale;
    }
    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, 0x9999, text, sizeof text), 0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_FLAGS));

    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGLANGUAGE, text, -1), 0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
    SetLastError(untouched);
    EXPECT_EQ(GetLocaleInfoA(kEnglishUs, LOCALE_SENGLANGUAGE, nullptr, 5), 0);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
}
