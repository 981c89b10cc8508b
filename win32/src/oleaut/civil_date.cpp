#include "oleaut/civil_date.h"

#include <cmath>

namespace vkw32 {
namespace {

constexpr long long kSecondsPerDay = 86400;
// 30 December 1899 counted from 1 March of year 0.
constexpr long long kVariantEpochFromMarch0 = 693899;

long long FloorDiv(long long a, long long b) {
    return a / b - ((a % b != 0) && ((a < 0) != (b < 0)));
}

} // namespace

bool IsLeapYear(int year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

int DaysInMonth(int year, int month) {
    static const int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    if (month < 1 || month > 12)
        return 0;
    return month == 2 && IsLeapYear(year) ? 29 : days[month - 1];
}

// Years start on 1 March so that the leap day comes last; 400-year eras
// of 146097 days make the count exact for any year.
long long VariantDayFromCivil(int year, int month, int day) {
    long long y = year;
    long long m = month;
    y += FloorDiv(m - 1, 12);
    m = m - 1 - 12 * FloorDiv(m - 1, 12) + 1;
    if (m <= 2)
        --y;
    const long long era = FloorDiv(y, 400);
    const long long yearOfEra = y - era * 400;
    const long long monthFromMarch = m > 2 ? m - 3 : m + 9;
    const long long dayOfYear = (153 * monthFromMarch + 2) / 5 + (day - 1);
    const long long dayOfEra = yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + dayOfYear;
    return era * 146097 + dayOfEra - kVariantEpochFromMarch0;
}

CivilDate CivilFromVariantDay(long long day) {
    const long long z = day + kVariantEpochFromMarch0;
    const long long era = FloorDiv(z, 146097);
    const long long dayOfEra = z - era * 146097;
    const long long yearOfEra =
        (dayOfEra - dayOfEra / 1460 + dayOfEra / 36524 - dayOfEra / 146096) / 365;
    const long long dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
    const long long monthFromMarch = (5 * dayOfYear + 2) / 153;
    CivilDate date;
    date.day = static_cast<int>(dayOfYear - (153 * monthFromMarch + 2) / 5 + 1);
    date.month = static_cast<int>(monthFromMarch < 10 ? monthFromMarch + 3 : monthFromMarch - 9);
    date.year = static_cast<int>(yearOfEra + era * 400 + (date.month <= 2));
    return date;
}

int WeekdayOfVariantDay(long long day) {
    return static_cast<int>(day - 1 - 7 * FloorDiv(day - 1, 7));
}

bool MakeVariantTime(long long day, long long secondsOfDay, double* result) {
    if (day < kFirstVariantDay || day > kLastVariantDay)
        return false;
    const double fraction = static_cast<double>(secondsOfDay) / kSecondsPerDay;
    *result = day >= 0 ? static_cast<double>(day) + fraction : static_cast<double>(day) - fraction;
    return true;
}

bool SplitVariantTime(double value, long long* day, long long* secondsOfDay) {
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
