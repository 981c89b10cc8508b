#include "calendar/calendar_shift.h"

#include <vaskel/calendar.h>
#include <vaskel/diag.h>

namespace vaskel {
namespace {

void LimitFebruary(SYSTEMTIME& time) {
    if (time.wMonth != 2)
        return;
    const WORD last = CDateTime::IsLeapYear(time.wYear) ? 29 : 28;
    if (time.wDay > last)
        time.wDay = last;
}

void StoreIfValid(double& variantTime, SYSTEMTIME& time) {
    // The conversion reads years below 100 as two-digit years, which would
    // turn a shift before the year 100 into a date 1900 years later.
    if (time.wYear < 100)
        return;
    double shifted = 0.0;
    if (SystemTimeToVariantTime(&time, &shifted))
        variantTime = shifted;
}

} // namespace

SYSTEMTIME BrokenDown(double variantTime) {
    SYSTEMTIME time = {};
    if (!VariantTimeToSystemTime(variantTime, &time))
        throw unexpected_error();
    return time;
}

void ShiftMonths(double& variantTime, int months) {
    SYSTEMTIME time = BrokenDown(variantTime);
    const int years = months / 12;
    const int rest = months - 12 * years;
    if (years >= 32767)
        throw unexpected_error();
    // The fields are 16 bits wide and wrap as such; a wrapped year fails
    // the conversion back and leaves the value alone.
    time.wYear = static_cast<WORD>(time.wYear + years);
    if (rest < 0 && time.wMonth <= -rest) {
        time.wYear = static_cast<WORD>(time.wYear - 1);
        time.wMonth = static_cast<WORD>(time.wMonth + 12);
    }
    time.wMonth = static_cast<WORD>(time.wMonth + rest);
    if (time.wMonth > 12) {
        time.wYear = static_cast<WORD>(time.wYear + 1);
        time.wMonth = static_cast<WORD>(time.wMonth - 12);
    }
    LimitFebruary(time);
    StoreIfValid(variantTime, time);
}

void ShiftYears(double& variantTime, int years) {
    SYSTEMTIME time = BrokenDown(variantTime);
    time.wYear = static_cast<WORD>(time.wYear + years);
    LimitFebruary(time);
    StoreIfValid(variantTime, time);
}

} // namespace vaskel
