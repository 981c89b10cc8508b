#include "calendar/day_fractions.h"

#include <vaskel/calendar.h>
#include <vaskel/text.h>

#include <algorithm>
#include <charconv>
#include <climits>
#include <cmath>
#include <cstdio>
#include <limits>

namespace vaskel {
namespace {

// Whole values beyond the 32-bit range saturate instead of overflowing; the
// 32-bit limit keeps the results the same on every platform.
template <class Integer>
Integer Saturated(double value) {
    if (std::isnan(value))
        return 0;
    if (value >= static_cast<double>(std::numeric_limits<Integer>::max()))
        return std::numeric_limits<Integer>::max();
    if (value <= static_cast<double>(std::numeric_limits<Integer>::min()))
        return std::numeric_limits<Integer>::min();
    return static_cast<Integer>(value);
}

long Truncated(double value) {
    return Saturated<LONG>(std::trunc(value));
}

long AwayFromZero(double value) {
    return Saturated<LONG>(value >= 0.0 ? std::ceil(value) : std::floor(value));
}

double Fraction(double value) {
    return value - std::trunc(value);
}

} // namespace

const double CTimeSpan::HoursPerDay = 24.0;
const double CTimeSpan::MinutesPerDay = 1440.0;
const double CTimeSpan::SecondsPerDay = 86400.0;
const double CTimeSpan::MillisecondsPerDay = 86400000.0;

double CTimeSpan::Rounded(double days) {
    return VKRoundFloat(days * MillisecondsPerDay) * dayPerMillisecond;
}

CTimeSpan::CTimeSpan(double days) : m_span(Rounded(days)) {}

CTimeSpan::CTimeSpan(double days, double hours, double minutes, double seconds, double milliseconds)
    : m_span(0.0) {
    SetSpan(days, hours, minutes, seconds, milliseconds);
}

CTimeSpan& CTimeSpan::SetSpan(double days) {
    m_span = Rounded(days);
    return *this;
}

CTimeSpan& CTimeSpan::SetSpan(double days, double hours, double minutes, double seconds,
                              double milliseconds) {
    m_span = Rounded(((hours * dayPerHour + days) + minutes * dayPerMinute) +
                     seconds * dayPerSecond + milliseconds * dayPerMillisecond);
    return *this;
}

CTimeSpan& CTimeSpan::SetDaySpan(double days) {
    return SetSpan(days);
}
CTimeSpan& CTimeSpan::SetHourSpan(double hours) {
    return SetSpan(hours * dayPerHour);
}
CTimeSpan& CTimeSpan::SetMinuteSpan(double minutes) {
    return SetSpan(minutes * dayPerMinute);
}
CTimeSpan& CTimeSpan::SetSecondsSpan(double seconds) {
    return SetSpan(seconds * dayPerSecond);
}
CTimeSpan& CTimeSpan::SetMillisecondsSpan(double milliseconds) {
    return SetSpan(milliseconds * dayPerMillisecond);
}
CTimeSpan& CTimeSpan::operator=(double days) {
    return SetSpan(days);
}

long CTimeSpan::GetFullDays() const {
    return Truncated(m_span);
}
long CTimeSpan::GetFullHours() const {
    return Truncated(GetTotalHours());
}
long CTimeSpan::GetFullMinutes() const {
    return Truncated(GetTotalMinutes());
}
long CTimeSpan::GetFullSeconds() const {
    return Truncated(GetTotalSeconds());
}
long CTimeSpan::GetFullMilliseconds() const {
    return Truncated(GetTotalMilliseconds());
}

long CTimeSpan::GetPartialDays() const {
    return AwayFromZero(m_span);
}
long CTimeSpan::GetPartialHours() const {
    return AwayFromZero(GetTotalHours());
}
long CTimeSpan::GetPartialMinutes() const {
    return AwayFromZero(GetTotalMinutes());
}
long CTimeSpan::GetPartialSeconds() const {
    return AwayFromZero(GetTotalSeconds());
}
long CTimeSpan::GetPartialMilliseconds() const {
    return AwayFromZero(GetTotalMilliseconds());
}

double CTimeSpan::GetHours_() const {
    return Fraction(m_span) * 24.0;
}
double CTimeSpan::GetMinutes_() const {
    return Fraction(m_span * 24.0) * 60.0;
}
double CTimeSpan::GetSeconds_() const {
    return Fraction(m_span * 1440.0) * 60.0;
}
double CTimeSpan::GetMilliseconds_() const {
    return Fraction(m_span * 86400.0) * 1000.0;
}
long CTimeSpan::GetHours() const {
    return Truncated(GetHours_());
}
long CTimeSpan::GetMinutes() const {
    return Truncated(GetMinutes_());
}
long CTimeSpan::GetSeconds() const {
    return Truncated(GetSeconds_());
}
long CTimeSpan::GetMilliseconds() const {
    return Truncated(GetMilliseconds_());
}

double CTimeSpan::GetTimePortion() const {
    return Fraction(m_span);
}
long CTimeSpan::GetDatePortion() const {
    return Truncated(m_span);
}

CTimeSpan CTimeSpan::operator+(const CTimeSpan& other) const {
    return CTimeSpan(m_span + other.m_span);
}
CTimeSpan CTimeSpan::operator-(const CTimeSpan& other) const {
    return CTimeSpan(m_span - other.m_span);
}
CTimeSpan CTimeSpan::operator-() const {
    return CTimeSpan(-m_span);
}

CTimeSpan& CTimeSpan::operator+=(const CTimeSpan& other) {
    m_span += other.m_span;
    return *this;
}

CTimeSpan& CTimeSpan::operator-=(CTimeSpan other) {
    m_span -= other.m_span;
    return *this;
}

CString CTimeSpan::ToString() const {
    // "%d.%2d.%2d.%2d.%3d", written directly: this text is produced often.
    const int values[] = {static_cast<int>(GetDatePortion()), static_cast<int>(GetHours()),
                          static_cast<int>(GetMinutes()), static_cast<int>(GetSeconds()),
                          static_cast<int>(GetMilliseconds())};
    const int widths[] = {0, 2, 2, 2, 3};
    char text[64];
    char* p = text;
    for (int i = 0; i < 5; ++i) {
        if (i > 0)
            *p++ = '.';
        char digits[16];
        char* end = std::to_chars(digits, digits + sizeof digits, values[i]).ptr;
        for (int pad = widths[i] - static_cast<int>(end - digits); pad > 0; --pad)
            *p++ = ' ';
        p = std::copy(digits, end, p);
    }
    return CString(text, static_cast<int>(p - text));
}

CString CTimeSpan::ToStringAsTimeRemaining() const {
    // Below every named resolution: nothing is rounded, nothing dropped.
    return ToStringAsTimeRemaining(static_cast<ETimeResolution>(19));
}

CString CTimeSpan::ToStringAsTimeRemaining(ETimeResolution resolution) const {
    struct Unit {
        int code;
        long carryLimit;
        double (CTimeSpan::*component)() const;
        const char* singular;
        const char* plural;
    };
    static const Unit units[] = {
        {MilliSeconds, 1000, &CTimeSpan::GetMilliseconds_, "millisecond", "milliseconds"},
        {Seconds, 60, &CTimeSpan::GetSeconds_, "second", "seconds"},
        {Minutes, 60, &CTimeSpan::GetMinutes_, "minute", "minutes"},
        {Hours, 24, &CTimeSpan::GetHours_, "hour", "hours"},
        {Days, INT_MAX, &CTimeSpan::GetTotalDays, "day", "days"},
    };
    const int unitCount = 5;
    int counts[unitCount] = {};
    for (int i = 0; i < unitCount; ++i) {
        if (units[i].code < resolution)
            continue;
        double component = (this->*units[i].component)();
        if (units[i].code == resolution)
            component = VKRoundFloat(component);
        counts[i] = Saturated<int>(std::trunc(component));
    }
    // One carry pass, finer to coarser: only rounding can fill a unit.
    for (int i = 0; i + 1 < unitCount; ++i) {
        if (counts[i] >= units[i].carryLimit) {
            ++counts[i + 1];
            counts[i] = 0;
        }
    }
    char text[1024];
    int length = 0, written = 0;
    for (int i = unitCount - 1; i >= 0 && written < 2; --i) {
        if (counts[i] == 0)
            continue;
        int step = std::snprintf(text + length, sizeof text - static_cast<size_t>(length),
                                 written ? " %d %s" : "%d %s", counts[i],
                                 counts[i] == 1 ? units[i].singular : units[i].plural);
        if (step < 0 || static_cast<size_t>(length + step) >= sizeof text)
            return CString();
        length += step;
        ++written;
    }
    return CString(text, length);
}

} // namespace vaskel
