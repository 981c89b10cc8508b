#include "calendar/day_fractions.h"

#include <vaskel/calendar.h>

#include <cmath>

namespace vaskel {
namespace {

// Keeps the sign of the value: -1.25 gives -0.25.
double PlainFraction(double value) {
    return value - std::trunc(value);
}

// A negative fraction counts back from midnight: -1.25 gives 0.75.
double WrappedFraction(double value) {
    const double fraction = PlainFraction(value);
    return fraction < 0.0 ? fraction + 1.0 : fraction;
}

// The time of day of a converted date-time. Before 30 December 1899 the
// fraction is negative and its absolute value is the time of day; wrapping
// it would turn 06:00 into 18:00.
double TimeOfDay(const CDateTime& dateTime) {
    return std::fabs(PlainFraction(dateTime.GetValue()));
}

} // namespace

CTime::CTime(double value) : m_value(PlainFraction(value)) {}

CTime::CTime(const CDateTime& dateTime) : m_value(PlainFraction(dateTime.GetValue())) {}

CTime::CTime(int hour, int minute, int second) : m_value(0.0) {
    SetTime(hour, minute, second);
}

CTime::CTime(const SYSTEMTIME& time) : m_value(0.0) {
    FromSystemTime(time);
}

void CTime::SetValue(double value) {
    m_value = WrappedFraction(value);
}

bool CTime::SetTime(int hour, int minute, int second) {
    CDateTime converted;
    if (!converted.SetDateTime(0, 0, 0, hour, minute, second))
        return false;
    m_value = TimeOfDay(converted);
    return true;
}

bool CTime::FromSystemTime(const SYSTEMTIME& time) {
    CDateTime converted;
    if (!converted.FromSystemTime(time))
        return false;
    m_value = TimeOfDay(converted);
    return true;
}

CTime CTime::Now() {
    return CTime(CDateTime::Now());
}

void CTime::AddSeconds(int seconds) {
    SetValue(m_value + seconds * dayPerSecond);
}

void CTime::AddMinutes(int minutes) {
    SetValue(m_value + minutes * dayPerMinute);
}

CTime& CTime::operator+=(const CTimeSpan& span) {
    SetValue(m_value + span.GetSpan());
    return *this;
}

CTime& CTime::operator-=(const CTimeSpan& span) {
    SetValue(m_value - span.GetSpan());
    return *this;
}

CDateTime CTime::operator+(const CJulianDate& date) const {
    return date + *this;
}

bool CTime::ParseTime(const char* text, DWORD flags, LCID locale) {
    CDateTime parsed;
    if (!parsed.ParseDateTime(text, flags, locale))
        return false;
    m_value = TimeOfDay(parsed);
    return true;
}

bool CTime::FromString(const char* text) {
    return ParseTime(text, 0, LOCALE_USER_DEFAULT);
}

} // namespace vaskel
