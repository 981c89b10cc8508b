// Day counting in the proleptic Gregorian calendar, shared by the variant
// date conversions and the date text services.
#pragma once

#include <vkwin32/types.h>

namespace vkw32 {

// The variant-time day number of 1 January 100 and of 31 December 9999.
constexpr long long kFirstVariantDay = -657434;
constexpr long long kLastVariantDay = 2958465;

struct CivilDate {
    int year;
    int month; // 1-12
    int day;   // 1-31
};

bool IsLeapYear(int year);
int DaysInMonth(int year, int month);

// Variant-time day number (0 is 30 December 1899) of a date whose day may lie
// outside its month: day 0 is the last day of the month before, day 32 of
// January is 1 February.
long long VariantDayFromCivil(int year, int month, int day);
CivilDate CivilFromVariantDay(long long day);
// 0 = Sunday ... 6 = Saturday; day 1 is a Sunday.
int WeekdayOfVariantDay(long long day);

// The variant time of a day number and seconds since midnight, with the
// sign rule of negative values; false outside 1 January 100 to 31 December
// 9999.
bool MakeVariantTime(long long day, long long secondsOfDay, double* result);
// The day number and whole seconds since midnight of a variant time,
// rounded to the nearest second; false outside the range.
bool SplitVariantTime(double value, long long* day, long long* secondsOfDay);

} // namespace vkw32
