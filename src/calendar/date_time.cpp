#include "calendar/calendar_shift.h"
#include "calendar/day_fractions.h"

#include <vaskel/calendar.h>
#include <vaskel/diag.h>

#include <cmath>
#include <ctime>
#include <limits>

namespace vaskel {
namespace {

double DatePart(double value) {
    return std::trunc(value);
}

} // namespace

CDateTime::CDateTime(int year, int month, int day, int hour, int minute, int second)
    : m_value(0.0) {
    SetDateTime(year, month, day, hour, minute, second);
}

CDateTime::CDateTime(const SYSTEMTIME& time) : m_value(0.0) {
    FromSystemTime(time);
}

LONG CDateTime::GetDatePortion() const {
    const double date = DatePart(m_value);
    // Values past the 32-bit range saturate instead of overflowing.
    if (!(date > std::numeric_limits<LONG>::min()))
        return date < 0 ? std::numeric_limits<LONG>::min() : 0;
    if (date > std::numeric_limits<LONG>::max())
        return std::numeric_limits<LONG>::max();
    return static_cast<LONG>(date);
}

double CDateTime::GetTimePortion() const {
    return m_value - DatePart(m_value);
}

void CDateTime::SetDatePortion(LONG date) {
    m_value = GetTimePortion() + date;
}

void CDateTime::SetTimePortion(double time) {
    m_value = DatePart(m_value) + time;
}

void CDateTime::SetDateOnly() {
    m_value = DatePart(m_value);
}

void CDateTime::SetTimeOnly() {
    m_value = GetTimePortion();
}

DWORD CDateTime::GetJulianDate(double value) {
    // The low 32 bits of the 64-bit truncation; beyond 64 bits and for NaN
    // there is no such number, and the null date stands in.
    const double date = std::trunc(value);
    if (!(std::fabs(date) < 9.2e18))
        return 0;
    return static_cast<DWORD>(static_cast<ULONGLONG>(static_cast<LONGLONG>(date)));
}

int CDateTime::GetMinuteOfTheDay(double value) {
    const double minutes = std::trunc((value - DatePart(value)) * 1440.0);
    return std::isnan(minutes) ? 0 : static_cast<int>(minutes);
}

EDayOfWeek CDateTime::GetDayOfTheWeek() const {
    const double date = DatePart(m_value);
    if (std::isnan(date))
        return InvalidDay;
    const double weekday = std::fmod(date - 1.0, 7.0);
    return static_cast<EDayOfWeek>(static_cast<int>(weekday < 0 ? weekday + 7.0 : weekday));
}

DWORD CDateTime::GetYear() const {
    return ToSystemTime().wYear;
}
DWORD CDateTime::GetMonth() const {
    return ToSystemTime().wMonth;
}
DWORD CDateTime::GetDay() const {
    return ToSystemTime().wDay;
}
DWORD CDateTime::GetHour() const {
    return ToSystemTime().wHour;
}
DWORD CDateTime::GetMinute() const {
    return ToSystemTime().wMinute;
}
DWORD CDateTime::GetSecond() const {
    return ToSystemTime().wSecond;
}
DWORD CDateTime::GetMilliseconds() const {
    return ToSystemTime().wMilliseconds;
}

ECalendarMonth CDateTime::GetCalendarMonth() const {
    return CalendarMonthX::GetMonthOneBased(static_cast<int>(GetMonth()));
}

bool CDateTime::IsLeapYear(DWORD year) {
    return year % 400 == 0 || (year % 100 != 0 && year % 4 == 0);
}

unsigned char CDateTime::DaysInMonth(DWORD year, ECalendarMonth month) {
    switch (month) {
    case January:
    case March:
    case May:
    case July:
    case August:
    case October:
    case December:
        return 31;
    case April:
    case June:
    case September:
    case November:
        return 30;
    case February:
        return IsLeapYear(year) ? 29 : 28;
    default:
        return 0;
    }
}

unsigned char CDateTime::DaysInMonth(DWORD year, int month) {
    return DaysInMonth(year, CalendarMonthX::GetMonth(month));
}

unsigned char CDateTime::DaysInMonthOneBased(DWORD year, int month) {
    return DaysInMonth(year, CalendarMonthX::GetMonthOneBased(month));
}

bool CDateTime::SetDate(int year, int month, int day) {
    return SetDateTime(year, month, day, 0, 0, 0);
}

bool CDateTime::SetDateTime(int year, int month, int day, int hour, int minute, int second) {
    SYSTEMTIME time = {};
    time.wYear = static_cast<WORD>(year);
    time.wMonth = static_cast<WORD>(month);
    time.wDay = static_cast<WORD>(day);
    time.wHour = static_cast<WORD>(hour);
    time.wMinute = static_cast<WORD>(minute);
    time.wSecond = static_cast<WORD>(second);
    return FromSystemTime(time);
}

bool CDateTime::SetTime(int hour, int minute, int second) {
    CDateTime converted;
    if (!converted.SetDateTime(0, 0, 0, hour, minute, second))
        return false;
    m_value = converted.GetTimePortion();
    return true;
}

bool CDateTime::FromSystemTime(const SYSTEMTIME& time) {
    SYSTEMTIME copy = time;
    double value = 0.0;
    if (!SystemTimeToVariantTime(&copy, &value))
        return false;
    m_value = value;
    return true;
}

bool CDateTime::ToSystemTime(SYSTEMTIME& time) const {
    time = SYSTEMTIME();
    return VariantTimeToSystemTime(m_value, &time) != FALSE;
}

SYSTEMTIME CDateTime::ToSystemTime() const {
    return BrokenDown(m_value);
}

CDateTime CDateTime::Now() {
    const time_t now = std::time(nullptr);
    struct tm local = {};
    if (localtime_s(&local, &now) != 0)
        return CDateTime();
    CDateTime result;
    result.SetDateTime(local.tm_year + 1900, local.tm_mon + 1, local.tm_mday, local.tm_hour,
                       local.tm_min, local.tm_sec);
    return result;
}

CDateTime CDateTime::NowDateOnly() {
    CDateTime now = Now();
    now.SetDateOnly();
    return now;
}

CDateTime CDateTime::NowTimeOnly() {
    CDateTime now = Now();
    now.SetTimeOnly();
    return now;
}

void CDateTime::AddMinutes(int minutes) {
    m_value += minutes * dayPerMinute;
}

void CDateTime::AddSeconds(int seconds) {
    m_value += seconds * dayPerSecond;
}

void CDateTime::AddMonths(int months) {
    ShiftMonths(m_value, months);
}

void CDateTime::AddYears(int years) {
    ShiftYears(m_value, years);
}

int CDateTime::Compare(double value) const {
    if (m_value < value)
        return -1;
    return m_value > value ? 1 : 0;
}

int CDateTime::CompareToMilisecondResolution(double a, double b) {
    double difference = a - b;
    if (difference > -1.0 && difference < 1.0)
        difference *= 86400000.0;
    if (difference <= -1.0)
        return -1;
    return difference >= 1.0 ? 1 : 0;
}

} // namespace vaskel
