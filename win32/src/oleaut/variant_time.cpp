#include "oleaut/civil_date.h"

#include <vkwin32/oleauto.h>

using namespace vkw32;

extern "C" {

INT WINAPI SystemTimeToVariantTime(LPSYSTEMTIME systemTime, DOUBLE* variantTime) {
    if (!systemTime || !variantTime)
        return FALSE;
    const SYSTEMTIME& st = *systemTime;
    if (st.wMonth > 12 || st.wDay > 31 || static_cast<SHORT>(st.wYear) < 0)
        return FALSE;
    // Two-digit years: 0-29 are this century's, 30-99 the last one's, the
    // system's documented default window.
    int year = st.wYear;
    if (year < 30)
        year += 2000;
    else if (year < 100)
        year += 1900;
    if (year > 9999)
        return FALSE;
    // Month 0 and day 0 step back; days past the month roll forward. The
    // time fields roll either way, read as signed 16-bit numbers.
    // Milliseconds are ignored.
    int month = st.wMonth;
    if (month == 0) {
        month = 12;
        --year;
    }
    long long seconds = static_cast<SHORT>(st.wHour) * 3600LL +
                        static_cast<SHORT>(st.wMinute) * 60LL + static_cast<SHORT>(st.wSecond);
    long long carry = seconds / 86400;
    seconds %= 86400;
    if (seconds < 0) {
        seconds += 86400;
        --carry;
    }
    const long long day = VariantDayFromCivil(year, month, 1) + (st.wDay - 1) + carry;
    return MakeVariantTime(day, seconds, variantTime) ? TRUE : FALSE;
}

INT WINAPI VariantTimeToSystemTime(DOUBLE variantTime, LPSYSTEMTIME systemTime) {
    long long day = 0;
    long long seconds = 0;
    if (!systemTime || !SplitVariantTime(variantTime, &day, &seconds))
        return FALSE;
    const CivilDate date = CivilFromVariantDay(day);
    SYSTEMTIME& st = *systemTime;
    st.wYear = static_cast<WORD>(date.year);
    st.wMonth = static_cast<WORD>(date.month);
    st.wDayOfWeek = static_cast<WORD>(WeekdayOfVariantDay(day));
    st.wDay = static_cast<WORD>(date.day);
    st.wHour = static_cast<WORD>(seconds / 3600);
    st.wMinute = static_cast<WORD>(seconds / 60 % 60);
    st.wSecond = static_cast<WORD>(seconds % 60);
    st.wMilliseconds = 0;
    return TRUE;
}

} // extern "C"
