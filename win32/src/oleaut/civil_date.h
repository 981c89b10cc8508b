// Day counting in the proleptic Gregorian calendar, shared by the variant
// date conversions and the date text services. Inline: the conversions are
// a few multiplications, which a call would double.
#pragma once

#include <vkwin32/types.h>

#include <cmath>

namespace vkw32 {

// The variant-time day number of 1 January 100 and of 31 December 9999.
constexpr long long kFirstVariantDay = -657434;
constexpr long long kLastVariantDay = 2958465;
constexpr long long kSecondsPerDay = 86400;

struct CivilDate {
    int year;
    int month; // 1-12
    int day;   // 1-31
};

inline bool IsLeapYear(int year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

inline int DaysInMonth(int year, int month) {
    static const int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    if (month < 1 || month > 12)
        return 0;
    return month == 2 && IsLeapYear(year) ? 29 : days[month - 1];
}

namespace detail {

// 30 December 1899 counted from 1 March of the year 0.
constexpr int kVariantEpochFromMarch0 = 693899;

inline int FloorDiv(int a, int b) {
    return a / b - ((a % b != 0) && ((a < 0) != (b < 0)));
}

} // namespace detail

// Variant-time day number (0 is 30 December 1899) of a date whose day may lie
// outside its month (day 0 is the last day of the month before, 32 January
// is 1 February) and whose month may lie outside 1-12. Years start on
// 1 March so that the leap day comes last; 400-year eras of 146097 days make
// the count exact for any year.
inline long long VariantDayFromCivil(int year, int month, int day) {
    if (month < 1 || month > 12) {
        year += detail::FloorDiv(month - 1, 12);
        month -= 12 * detail::FloorDiv(month - 1, 12);
    }
    if (month <= 2)
        --year;
    const int era = (year >= 0 ? year : year - 399) / 400;
    const unsigned yearOfEra = static_cast<unsigned>(year - era * 400);
    const unsigned monthFromMarch = static_cast<unsigned>(month > 2 ? month - 3 : month + 9);
    const unsigned dayOfEra =
        yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + (153 * monthFromMarch + 2) / 5;
    return era * 146097LL + dayOfEra + (day - 1) - detail::kVariantEpochFromMarch0;
}

// The date of a day number within the variant-time range (or a few million
// days around it).
inline CivilDate CivilFromVariantDay(long long day) {
    const int z = static_cast<int>(day) + detail::kVariantEpochFromMarch0;
    const int era = (z >= 0 ? z : z - 146096) / 146097;
    const unsigned dayOfEra = static_cast<unsigned>(z - era * 146097);
    const unsigned yearOfEra =
        (dayOfEra - dayOfEra / 1460 + dayOfEra / 36524 - dayOfEra / 146096) / 365;
    const unsigned dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
    const unsigned monthFromMarch = (5 * dayOfYear + 2) / 153;
    CivilDate date;
    date.day = static_cast<int>(dayOfYear - (153 * monthFromMarch + 2) / 5 + 1);
    date.month = static_cast<int>(monthFromMarch < 10 ? monthFromMarch + 3 : monthFromMarch - 9);
    date.year = static_cast<int>(yearOfEra) + era * 400 + (date.month <= 2);
    return date;
}

// 0 = Sunday ... 6 = Saturday; day 1 is a Sunday.
inline int WeekdayOfVariantDay(long long day) {
    const long long weekday = (day - 1) % 7;
    return static_cast<int>(weekday < 0 ? weekday + 7 : weekday);
}

// The variant time of a day number and seconds since midnight, with the
// sign rule of negative values; false outside 1 January 100 to 31 December
// 9999.
inline bool MakeVariantTime(long long day, long long secondsOfDay, double* result) {
    if (day < kFirstVariantDay || day > kLastVariantDay)
        return false;
    const double fraction = static_cast<double>(secondsOfDay) / kSecondsPerDay;
    *result = day >= 0 ? static_cast<double>(day) + fraction : static_cast<double>(day) - fraction;
    return true;
}

// The day number and whole seconds since midnight of a variant time,
// rounded to the nearest second; false outside the range.
inline bool SplitVariantTime(double value, long long* day, long long* secondsOfDay) {
    if (!(value > kFirstVariantDay - 1.0 && value < kLastVariantDay + 1.0))
        return false;
    const double datePart = std::trunc(value);
    long long d = static_cast<long long>(datePart);
    long long seconds =
        static_cast<long long>(std::floor(std::fabs(value - datePart) * kSecondsPerDay + 0.5));
    // A time that rounds up to midnight belongs to the next calendar day,
    // whichever the sign of the value.
    if (seconds >= kSecondsPerDay) {
        seconds -= kSecondsPerDay;
        ++d;
        if (d > kLastVariantDay)
            return false;
    }
    *day = d;
    *secondsOfDay = seconds;
    return true;
}

} // namespace vkw32
