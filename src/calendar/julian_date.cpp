#include "calendar/calendar_shift.h"

#include <vaskel/calendar.h>
#include <vaskel/diag.h>

namespace vaskel {
namespace {

DWORD TruncatedDay(double variantTime) {
    return CDateTime::GetJulianDate(variantTime);
}

} // namespace

EDayOfWeek DayOfWeekX::FromJulianDate(DWORD date) {
    return static_cast<EDayOfWeek>((static_cast<ULONGLONG>(date) + 6) % 7);
}

EDayOfWeek DayOfWeekX::TodaysDay() {
    return CDateTime::Now().GetDayOfTheWeek();
}

CJulianDate::CJulianDate(const CDateTime& dateTime) : m_date(dateTime.GetJulianDate()) {}

CJulianDate::CJulianDate(int year, int month, int day) : m_date(0) {
    SetDate(year, month, day);
}

bool CJulianDate::SetDate(double variantTime) {
    m_date = CDateTime::GetJulianDate(variantTime);
    return true;
}

bool CJulianDate::SetDate(int year, int month, int day) {
    CDateTime dateTime;
    if (!dateTime.SetDateTime(year, month, day, 0, 0, 0))
        return false;
    m_date = dateTime.GetJulianDate();
    return true;
}

bool CJulianDate::FromSystemTime(const SYSTEMTIME& time) {
    CDateTime dateTime;
    if (!dateTime.FromSystemTime(time))
        return false;
    m_date = dateTime.GetJulianDate();
    return true;
}

CDateTime CJulianDate::ToDateTime() const {
    return CDateTime(static_cast<double>(m_date));
}

SYSTEMTIME CJulianDate::ToSystemTime() const {
    return BrokenDown(static_cast<double>(m_date));
}

DWORD CJulianDate::GetYear() const {
    return ToSystemTime().wYear;
}

DWORD CJulianDate::GetMonth() const {
    return ToSystemTime().wMonth;
}

DWORD CJulianDate::GetDay() const {
    return ToSystemTime().wDay;
}

ECalendarMonth CJulianDate::GetCalendarMonth() const {
    return CalendarMonthX::GetMonthOneBased(static_cast<int>(GetMonth()));
}

CJulianDate CJulianDate::Now() {
    return CJulianDate(CDateTime::Now());
}

void CJulianDate::SetNow() {
    *this = Now();
}

void CJulianDate::AddDays(int days) {
    m_date = TruncatedDay(static_cast<double>(m_date) + days);
}

void CJulianDate::AddMonths(int months) {
    double value = static_cast<double>(m_date);
    ShiftMonths(value, months);
    m_date = TruncatedDay(value);
}

void CJulianDate::AddYears(int years) {
    double value = static_cast<double>(m_date);
    ShiftYears(value, years);
    m_date = TruncatedDay(value);
}

CJulianDate& CJulianDate::operator+=(const CTimeSpan& span) {
    m_date = TruncatedDay(static_cast<double>(m_date) + span.GetSpan());
    return *this;
}

CDateTime CJulianDate::operator+(const CTimeSpan& span) const {
    return CDateTime(static_cast<double>(m_date) + span.GetSpan());
}

CDateTime CJulianDate::operator+(const CTime& time) const {
    return CDateTime(static_cast<double>(m_date) + time.GetValue());
}

CTimeSpan CJulianDate::operator-(const CJulianDate& other) const {
    return CTimeSpan(static_cast<double>(m_date) - static_cast<double>(other.m_date));
}

CString CJulianDate::Format(DWORD flags, LCID locale) const {
    return ToDateTime().Format(flags, locale);
}

CString CJulianDate::Format(const char* format) const {
    return ToDateTime().Format(format);
}

CString CJulianDate::Format(UINT formatId) const {
    return ToDateTime().Format(formatId);
}

CString CJulianDate::ToString() const {
    return ToDateTime().ToString();
}

bool CJulianDate::ParseDate(const char* text, DWORD flags, LCID locale) {
    CDateTime parsed;
    if (!parsed.ParseDateTime(text, flags, locale))
        return false;
    m_date = parsed.GetJulianDate();
    return true;
}

bool CJulianDate::FromString(const char* text) {
    return ParseDate(text, 0, LOCALE_USER_DEFAULT);
}

CJulianDate CJulianDate::Parse(const char* text, DWORD flags, LCID locale) {
    CJulianDate date;
    if (!date.ParseDate(text, flags, locale))
        throw unexpected_error();
    return date;
}

} // namespace vaskel
