// Calendar and time: months, weekdays and time resolutions with their
// English names, sets of weekdays, time spans, dates, times of day and
// date-times on the variant-time scale (days since 30 December 1899).
#pragma once

#include <vaskel/export.h>
#include <vaskel/framework/string.h>
#include <vaskel/win32.h>

#include <type_traits>

namespace vaskel {

class CArchive;
class CDateTime;

// A fixed int underlying type makes every int a valid value, so the wrappers
// below can hold whatever int they are given without undefined behaviour.
enum ECalendarMonth : int {
    January = 0,
    February = 1,
    March = 2,
    April = 3,
    May = 4,
    June = 5,
    July = 6,
    August = 7,
    September = 8,
    October = 9,
    November = 10,
    December = 11,
    InvalidMonth = -1
};

enum EDayOfWeek : int {
    Sunday = 0,
    Monday = 1,
    Tuesday = 2,
    Wednesday = 3,
    Thursday = 4,
    Friday = 5,
    Saturday = 6,
    InvalidDay = -1
};

enum ETimeResolution : int {
    NanoSeconds = 20,
    MicroSeconds = 21,
    MilliSeconds = 22,
    Seconds = 23,
    Minutes = 24,
    Hours = 25,
    Days = 26,
    InvalidResolution = -1
};

// An enumeration as a comparable value object, one int wide. The value is
// handed out both as E& and as int&, so E must have the size of an int.
template <class E>
class CVKEnumHelper {
    static_assert(std::is_enum<E>::value && sizeof(E) == sizeof(int) && alignof(E) == alignof(int),
                  "CVKEnumHelper needs an enumeration of the size of int");

public:
    CVKEnumHelper() : m_nValue(0) {}
    CVKEnumHelper(E value) : m_nValue(static_cast<int>(value)) {}

    CVKEnumHelper& operator=(E value) {
        SetValue(value);
        return *this;
    }
    void Clear() { m_nValue = 0; }
    void SetValue(E value) { m_nValue = static_cast<int>(value); }

    E GetValue() const { return static_cast<E>(m_nValue); }
    // Non-const on purpose: a modifiable helper converts through E and a
    // constant one through int, so conversions to other integer types have
    // one best candidate instead of two.
    operator E() { return GetValue(); }
    operator int() const { return m_nValue; }
    E& GetValueRef() { return m_eValue; }
    const E& GetValueRef() const { return m_eValue; }
    int& GetIntRef() { return m_nValue; }
    const int& GetIntRef() const { return m_nValue; }

    bool Is(int value) const { return m_nValue == value; }
    bool operator==(const CVKEnumHelper& other) const { return m_nValue == other.m_nValue; }
    bool operator==(E value) const { return m_nValue == static_cast<int>(value); }
    bool operator==(int value) const { return m_nValue == value; }
    bool operator!=(const CVKEnumHelper& other) const { return m_nValue != other.m_nValue; }
    bool operator!=(E value) const { return m_nValue != static_cast<int>(value); }
    bool operator!=(int value) const { return m_nValue != value; }
    bool operator<(const CVKEnumHelper& other) const { return m_nValue < other.m_nValue; }
    bool operator<(int value) const { return m_nValue < value; }
    // Also for an enumerator itself, which would be as close to both of the above.
    bool operator<(E value) const { return m_nValue < static_cast<int>(value); }
    bool operator>(const CVKEnumHelper& other) const { return m_nValue > other.m_nValue; }
    bool operator>(int value) const { return m_nValue > value; }
    bool operator>(E value) const { return m_nValue > static_cast<int>(value); }

private:
    // The members read and write the value through the union, which GCC and
    // Clang let alias both views: a write through GetValueRef() or
    // GetIntRef() is seen by the members. Holding an E& and an int& of the
    // same helper and mixing writes and reads through them is not safe.
    union {
        int m_nValue;
        E m_eValue;
    };
};

// An enumeration wrapper as functions hand it out: a value that answers the
// wrapper's own queries and the helper's comparisons. The wrappers derive
// from CVKEnumHelper, so each already is that value.
template <class X>
using CVKEnumHelperWrapper = X;

struct VASKEL_API CalendarMonthX : public CVKEnumHelper<ECalendarMonth> {
    using CVKEnumHelper::CVKEnumHelper;
    using CVKEnumHelper::operator=;

    bool IsJanuary() const { return Is(January); }
    bool IsFebruary() const { return Is(February); }
    bool IsMarch() const { return Is(March); }
    bool IsApril() const { return Is(April); }
    bool IsMay() const { return Is(May); }
    bool IsJune() const { return Is(June); }
    bool IsJuly() const { return Is(July); }
    bool IsAugust() const { return Is(August); }
    bool IsSeptember() const { return Is(September); }
    bool IsOctober() const { return Is(October); }
    bool IsNovember() const { return Is(November); }
    bool IsDecember() const { return Is(December); }
    bool IsInvalidMonth() const { return Is(InvalidMonth); }

    void SetAsJanuary() { SetValue(January); }
    void SetAsFebruary() { SetValue(February); }
    void SetAsMarch() { SetValue(March); }
    void SetAsApril() { SetValue(April); }
    void SetAsMay() { SetValue(May); }
    void SetAsJune() { SetValue(June); }
    void SetAsJuly() { SetValue(July); }
    void SetAsAugust() { SetValue(August); }
    void SetAsSeptember() { SetValue(September); }
    void SetAsOctober() { SetValue(October); }
    void SetAsNovember() { SetValue(November); }
    void SetAsDecember() { SetValue(December); }
    void SetAsInvalidMonth() { SetValue(InvalidMonth); }

    // The English name ("September"), or its three letters ("Sep") when
    // fullName is false; "Invalid" / "Inv" for any other value.
    const char* ToString(bool fullName) const { return ToString(GetValue(), fullName); }
    static const char* ToString(ECalendarMonth month, bool fullName);

    // 0-11 as they are, anything else the invalid month.
    static ECalendarMonth GetMonth(int month);
    // 1-12 to 0-11, anything else the invalid month.
    static ECalendarMonth GetMonthOneBased(int month);
    static ECalendarMonth GetMonth(const SYSTEMTIME& time);
};

struct VASKEL_API DayOfWeekX : public CVKEnumHelper<EDayOfWeek> {
    using CVKEnumHelper::CVKEnumHelper;
    using CVKEnumHelper::operator=;

    bool IsSunday() const { return Is(Sunday); }
    bool IsMonday() const { return Is(Monday); }
    bool IsTuesday() const { return Is(Tuesday); }
    bool IsWednesday() const { return Is(Wednesday); }
    bool IsThursday() const { return Is(Thursday); }
    bool IsFriday() const { return Is(Friday); }
    bool IsSaturday() const { return Is(Saturday); }
    bool IsInvalidDay() const { return Is(InvalidDay); }

    void SetAsSunday() { SetValue(Sunday); }
    void SetAsMonday() { SetValue(Monday); }
    void SetAsTuesday() { SetValue(Tuesday); }
    void SetAsWednesday() { SetValue(Wednesday); }
    void SetAsThursday() { SetValue(Thursday); }
    void SetAsFriday() { SetValue(Friday); }
    void SetAsSaturday() { SetValue(Saturday); }
    void SetAsInvalidDay() { SetValue(InvalidDay); }

    // The English name ("Tuesday"), or its three letters ("Tue") when
    // fullName is false; "Invalid" / "Inv" for any other value.
    const char* ToString(bool fullName) const { return ToString(GetValue(), fullName); }
    static const char* ToString(EDayOfWeek day, bool fullName);

    // 0-6 as they are, anything else the invalid day.
    static EDayOfWeek GetDay(int day);

    // for (d = First(); d != InvalidDay; d = Next(d)) visits each day once:
    // Next does not wrap after Saturday, and Next(InvalidDay) is Sunday.
    static EDayOfWeek First() { return Sunday; }
    static EDayOfWeek Last() { return Saturday; }
    static EDayOfWeek Next(EDayOfWeek day);

    // The weekday of a day number: day 1 (31 December 1899) is a Sunday.
    static EDayOfWeek FromJulianDate(DWORD date);
    // Today's weekday in local time.
    static EDayOfWeek TodaysDay();

    // The day whose full or three-letter name is the whole text, ignoring
    // case; the invalid day for anything else or a null pointer.
    static EDayOfWeek FromString(const char* text);
    // The first day (from Sunday) whose name starts like the first length
    // bytes of the text, ignoring case: three-letter names below length 4,
    // full names from 4 on. Reading stops at a NUL within those bytes, and
    // a length beyond the name matches only when the text ends with it.
    static EDayOfWeek FromString(const char* text, DWORD length);
};

struct VASKEL_API TimeResolutionX : public CVKEnumHelper<ETimeResolution> {
    using CVKEnumHelper::CVKEnumHelper;
    using CVKEnumHelper::operator=;

    bool IsNanoSeconds() const { return Is(NanoSeconds); }
    bool IsMicroSeconds() const { return Is(MicroSeconds); }
    bool IsMilliSeconds() const { return Is(MilliSeconds); }
    bool IsSeconds() const { return Is(Seconds); }
    bool IsMinutes() const { return Is(Minutes); }
    bool IsHours() const { return Is(Hours); }
    bool IsDays() const { return Is(Days); }
    bool IsInvalid() const { return Is(InvalidResolution); }

    void SetAsNanoSeconds() { SetValue(NanoSeconds); }
    void SetAsMicroSeconds() { SetValue(MicroSeconds); }
    void SetAsMilliSeconds() { SetValue(MilliSeconds); }
    void SetAsSeconds() { SetValue(Seconds); }
    void SetAsMinutes() { SetValue(Minutes); }
    void SetAsHours() { SetValue(Hours); }
    void SetAsDays() { SetValue(Days); }
    void SetAsInvalid() { SetValue(InvalidResolution); }
};

// A set of weekdays as a bit mask: Monday is bit 0 up to Sunday in bit 6,
// unlike the EDayOfWeek numbering that starts on Sunday.
struct VASKEL_API DaysOfWeek {
    DaysOfWeek() : m_nDays(0) {}

    // HasX: all of X's bits are set; IsX: the set is exactly X.
    bool HasMonday() const { return HasBits(MondayBit); }
    bool HasTuesday() const { return HasBits(TuesdayBit); }
    bool HasWednesday() const { return HasBits(WednesdayBit); }
    bool HasThursday() const { return HasBits(ThursdayBit); }
    bool HasFriday() const { return HasBits(FridayBit); }
    bool HasSaturday() const { return HasBits(SaturdayBit); }
    bool HasSunday() const { return HasBits(SundayBit); }
    bool HasAllDays() const { return HasBits(AllDaysBits); }

    bool IsMonday() const { return m_nDays == MondayBit; }
    bool IsTuesday() const { return m_nDays == TuesdayBit; }
    bool IsWednesday() const { return m_nDays == WednesdayBit; }
    bool IsThursday() const { return m_nDays == ThursdayBit; }
    bool IsFriday() const { return m_nDays == FridayBit; }
    bool IsSaturday() const { return m_nDays == SaturdayBit; }
    bool IsSunday() const { return m_nDays == SundayBit; }
    bool IsAllDays() const { return m_nDays == AllDaysBits; }

    void AddMonday() { m_nDays |= MondayBit; }
    void AddTuesday() { m_nDays |= TuesdayBit; }
    void AddWednesday() { m_nDays |= WednesdayBit; }
    void AddThursday() { m_nDays |= ThursdayBit; }
    void AddFriday() { m_nDays |= FridayBit; }
    void AddSaturday() { m_nDays |= SaturdayBit; }
    void AddSunday() { m_nDays |= SundayBit; }
    void AddAllDays() { m_nDays |= AllDaysBits; }

    void RemoveMonday() { m_nDays &= ~MondayBit; }
    void RemoveTuesday() { m_nDays &= ~TuesdayBit; }
    void RemoveWednesday() { m_nDays &= ~WednesdayBit; }
    void RemoveThursday() { m_nDays &= ~ThursdayBit; }
    void RemoveFriday() { m_nDays &= ~FridayBit; }
    void RemoveSaturday() { m_nDays &= ~SaturdayBit; }
    void RemoveSunday() { m_nDays &= ~SundayBit; }
    void RemoveAllDays() { m_nDays &= ~AllDaysBits; }

    void SetMonday(bool present) { SetBits(MondayBit, present); }
    void SetTuesday(bool present) { SetBits(TuesdayBit, present); }
    void SetWednesday(bool present) { SetBits(WednesdayBit, present); }
    void SetThursday(bool present) { SetBits(ThursdayBit, present); }
    void SetFriday(bool present) { SetBits(FridayBit, present); }
    void SetSaturday(bool present) { SetBits(SaturdayBit, present); }
    void SetSunday(bool present) { SetBits(SundayBit, present); }
    void SetAllDays(bool present) { SetBits(AllDaysBits, present); }

    // The invalid day has no bit: adding or removing it changes nothing and
    // HasDay is true for it.
    bool HasDay(EDayOfWeek day) const { return HasBits(DayToBit(day)); }
    void AddDay(EDayOfWeek day) { m_nDays |= DayToBit(day); }
    void RemoveDay(EDayOfWeek day) { m_nDays &= ~DayToBit(day); }
    void SetDay(EDayOfWeek day, bool present) { SetBits(DayToBit(day), present); }

    // The day's bit, or 0 for any value that is not a day.
    static int DayToBit(EDayOfWeek day);
    // The day of a single day's bit; the invalid day for 0, several bits or
    // any other value.
    static EDayOfWeek BitToDay(int bit);

    // "(Monday,Friday,Sunday)": the full names from Monday to Sunday; the
    // empty string when no day is present.
    CString ToString() const;
    // Replaces the set with the days named in the text: the form ToString
    // writes, or names and prefixes as the length form of
    // DayOfWeekX::FromString reads them ("mon tue", "(Mo;Tu)"), separated by
    // blanks or one other character each. Unknown words are skipped; reading
    // stops where a word should start and no letter is.
    void FromString(const char* text);

private:
    static constexpr int MondayBit = 1;
    static constexpr int TuesdayBit = 2;
    static constexpr int WednesdayBit = 4;
    static constexpr int ThursdayBit = 8;
    static constexpr int FridayBit = 16;
    static constexpr int SaturdayBit = 32;
    static constexpr int SundayBit = 64;
    static constexpr int AllDaysBits = 127;

    bool HasBits(int bits) const { return (m_nDays & bits) == bits; }
    void SetBits(int bits, bool present) { m_nDays = present ? m_nDays | bits : m_nDays & ~bits; }

    int m_nDays;
};

// A signed length of time in days, so that it adds directly to a date-time.
// Producers round to whole milliseconds by multiplying by the reciprocal of
// the milliseconds in a day, so that spans built from the same parts are
// equal bit for bit; += and -= store their raw result.
class VASKEL_API CTimeSpan {
public:
    static const double HoursPerDay;
    static const double MinutesPerDay;
    static const double SecondsPerDay;
    static const double MillisecondsPerDay;

    CTimeSpan() : m_span(0.0) {}
    CTimeSpan(double days);
    CTimeSpan(double days, double hours, double minutes, double seconds, double milliseconds);

    CTimeSpan& SetSpan(double days);
    CTimeSpan& SetSpan(double days, double hours, double minutes, double seconds,
                       double milliseconds);
    CTimeSpan& SetDaySpan(double days);
    CTimeSpan& SetHourSpan(double hours);
    CTimeSpan& SetMinuteSpan(double minutes);
    CTimeSpan& SetSecondsSpan(double seconds);
    CTimeSpan& SetMillisecondsSpan(double milliseconds);
    CTimeSpan& operator=(double days);

    double GetSpan() const { return m_span; }
    double GetTotalDays() const { return m_span; }
    double GetDays_() const { return m_span; }
    operator double() const { return m_span; }
    double GetTotalHours() const { return m_span * HoursPerDay; }
    double GetTotalMinutes() const { return m_span * MinutesPerDay; }
    double GetTotalSeconds() const { return m_span * SecondsPerDay; }
    double GetTotalMilliseconds() const { return m_span * MillisecondsPerDay; }

    // Truncated toward zero.
    long GetFullDays() const;
    long GetDays() const { return GetFullDays(); }
    long GetFullHours() const;
    long GetFullMinutes() const;
    long GetFullSeconds() const;
    long GetFullMilliseconds() const;
    // A started unit counts as a whole one (away from zero).
    long GetPartialDays() const;
    long GetPartialHours() const;
    long GetPartialMinutes() const;
    long GetPartialSeconds() const;
    long GetPartialMilliseconds() const;

    // One component below the next larger unit, with the span's sign.
    long GetHours() const;
    long GetMinutes() const;
    long GetSeconds() const;
    long GetMilliseconds() const;
    double GetHours_() const;
    double GetMinutes_() const;
    double GetSeconds_() const;
    double GetMilliseconds_() const;

    CTimeSpan operator+(const CTimeSpan& other) const;
    CTimeSpan operator-(const CTimeSpan& other) const;
    CTimeSpan operator-() const;
    CTimeSpan& operator+=(const CTimeSpan& other);
    CTimeSpan& operator-=(CTimeSpan other);

    bool operator==(const CTimeSpan& other) const { return m_span == other.m_span; }
    bool operator!=(const CTimeSpan& other) const { return m_span != other.m_span; }
    bool operator<(const CTimeSpan& other) const { return m_span < other.m_span; }
    bool operator>(const CTimeSpan& other) const { return m_span > other.m_span; }
    bool operator<=(const CTimeSpan& other) const { return m_span <= other.m_span; }
    bool operator>=(const CTimeSpan& other) const { return m_span >= other.m_span; }
    bool operator==(double days) const { return m_span == days; }
    bool operator!=(double days) const { return m_span != days; }
    bool operator<(double days) const { return m_span < days; }
    bool operator>(double days) const { return m_span > days; }
    bool operator<=(double days) const { return m_span <= days; }
    bool operator>=(double days) const { return m_span >= days; }

    // "%d.%2d.%2d.%2d.%3d": days, hours, minutes, seconds, milliseconds.
    CString ToString() const;
    // The two most significant non-zero units in words, e.g. "1 day 2 hours";
    // units finer than the resolution are dropped and the unit at it rounded.
    CString ToStringAsTimeRemaining(ETimeResolution resolution) const;
    CString ToStringAsTimeRemaining() const;

protected:
    double GetTimePortion() const;
    long GetDatePortion() const;

private:
    static double Rounded(double days);

    double m_span;
};

class CTime;

// A date without a time of day: the whole-day part of a variant time, kept
// as an unsigned 32-bit day number (0 is 30 December 1899 and the null date).
class VASKEL_API CJulianDate {
public:
    CJulianDate() : m_date(0) {}
    CJulianDate(DWORD date) : m_date(date) {}
    CJulianDate(const CDateTime& dateTime);
    // Year, month (1-12), day; the date stays 0 when the conversion rejects it.
    CJulianDate(int year, int month, int day);

    CJulianDate& operator=(DWORD date) {
        m_date = date;
        return *this;
    }
    void SetValue(DWORD date) { m_date = date; }
    // The variant time truncated toward zero, as its low 32 bits.
    bool SetDate(double variantTime);
    bool SetDate(int year, int month, int day);
    bool FromSystemTime(const SYSTEMTIME& time);

    bool IsNull() const { return m_date == 0; }
    void SetNull() { m_date = 0; }
    DWORD GetValue() const { return m_date; }
    operator DWORD() const { return m_date; }

    CDateTime ToDateTime() const;
    // These throw unexpected_error when the day has no calendar date.
    SYSTEMTIME ToSystemTime() const;
    DWORD GetYear() const;
    DWORD GetMonth() const;
    DWORD GetDay() const;
    ECalendarMonth GetCalendarMonth() const;

    static CJulianDate Now();
    void SetNow();

    void AddDays(int days);
    // Months and years keep the day, except that February takes its last
    // day when the day is beyond it; they throw unexpected_error when the
    // day has no calendar date.
    void AddMonths(int months);
    void AddYears(int years);

    // A part day of the span is dropped.
    CJulianDate& operator+=(const CTimeSpan& span);
    CDateTime operator+(const CTimeSpan& span) const;
    CDateTime operator+(const CTime& time) const;
    CTimeSpan operator-(const CJulianDate& other) const;

    bool operator==(const CJulianDate& other) const { return m_date == other.m_date; }
    bool operator!=(const CJulianDate& other) const { return m_date != other.m_date; }
    bool operator<(const CJulianDate& other) const { return m_date < other.m_date; }
    bool operator==(DWORD date) const { return m_date == date; }
    bool operator!=(DWORD date) const { return m_date != date; }
    bool operator<(DWORD date) const { return m_date < date; }

    // The date at 00:00 in the text forms of CDateTime.
    CString Format(DWORD flags, LCID locale) const;
    CString Format(const char* format) const;
    CString Format(UINT formatId) const;
    CString ToString() const;

    bool ParseDate(const char* text, DWORD flags, LCID locale);
    bool FromString(const char* text);
    // Throws unexpected_error when the text is not a date.
    static CJulianDate Parse(const char* text, DWORD flags, LCID locale);

private:
    DWORD m_date;
};

// A point in time as one variant time: whole days since 30 December 1899,
// the fraction the time of day. For a negative value the date is the
// truncation and the time of day the absolute value of the fraction.
class VASKEL_API CDateTime {
public:
    CDateTime() : m_value(0.0) {}
    CDateTime(double value) : m_value(value) {}
    CDateTime(int year, int month, int day, int hour, int minute, int second);
    CDateTime(const SYSTEMTIME& time);

    CDateTime& operator=(double value) {
        m_value = value;
        return *this;
    }
    void SetValue(double value) { m_value = value; }
    double GetValue() const { return m_value; }
    operator double() const { return m_value; }
    double& GetValueRef() { return m_value; }

    bool IsNull() const { return m_value == 0.0; }
    void SetNull() { m_value = 0.0; }

    LONG GetDatePortion() const;
    double GetTimePortion() const;
    void SetDatePortion(LONG date);
    void SetTimePortion(double time);
    void SetDateOnly();
    void ClearTimePortion() { SetDateOnly(); }
    void SetTimeOnly();
    void ClearDatePortion() { SetTimeOnly(); }

    DWORD GetJulianDate() const { return GetJulianDate(m_value); }
    static DWORD GetJulianDate(double value);
    void SetJulianDate(DWORD date) { m_value = static_cast<double>(date); }

    // 0-1439 for values of 0 and above.
    int GetMinuteOfTheDay() const { return GetMinuteOfTheDay(m_value); }
    static int GetMinuteOfTheDay(double value);
    EDayOfWeek GetDayOfTheWeek() const;

    // These throw unexpected_error when the value has no calendar date.
    DWORD GetYear() const;
    DWORD GetMonth() const;
    DWORD GetDay() const;
    DWORD GetHour() const;
    DWORD GetMinute() const;
    DWORD GetSecond() const;
    DWORD GetMilliseconds() const;
    ECalendarMonth GetCalendarMonth() const;

    static bool IsLeapYear(DWORD year);
    static unsigned char DaysInMonth(DWORD year, ECalendarMonth month);
    // Zero-based month; 0 days for any other month number.
    static unsigned char DaysInMonth(DWORD year, int month);
    static unsigned char DaysInMonthOneBased(DWORD year, int month);

    // The setters keep the value when the conversion rejects the fields.
    bool SetDate(int year, int month, int day);
    bool SetDateTime(int year, int month, int day, int hour, int minute, int second);
    // Leaves a time-only value.
    bool SetTime(int hour, int minute, int second);
    bool FromSystemTime(const SYSTEMTIME& time);
    bool ToSystemTime(SYSTEMTIME& time) const;
    SYSTEMTIME ToSystemTime() const;

    // Local time in whole seconds; 0.0 when the clock has no local time.
    static CDateTime Now();
    void SetNow() { *this = Now(); }
    static CDateTime NowDateOnly();
    void SetNowDateOnly() { *this = NowDateOnly(); }
    static CDateTime NowTimeOnly();
    void SetNowtimeOnly() { *this = NowTimeOnly(); }

    CDateTime operator+(const CTimeSpan& span) const { return CDateTime(m_value + span.GetSpan()); }
    CDateTime operator-(const CTimeSpan& span) const { return CDateTime(m_value - span.GetSpan()); }
    CDateTime& operator+=(const CTimeSpan& span) {
        m_value += span.GetSpan();
        return *this;
    }
    CDateTime& operator-=(const CTimeSpan& span) {
        m_value -= span.GetSpan();
        return *this;
    }
    // Rounded to whole milliseconds.
    CTimeSpan operator-(const CDateTime& other) const { return CTimeSpan(m_value - other.m_value); }

    void AddDays(int days) { m_value += days; }
    void AddMinutes(int minutes);
    void AddSeconds(int seconds);
    // Keep the time of day; February takes its last day when the day is
    // beyond it, other months keep the day as it is. They throw
    // unexpected_error when the value has no calendar date.
    void AddMonths(int months);
    void AddYears(int years);

    bool operator==(const CDateTime& other) const { return m_value == other.m_value; }
    bool operator!=(const CDateTime& other) const { return m_value != other.m_value; }
    bool operator<(const CDateTime& other) const { return m_value < other.m_value; }
    bool operator==(double value) const { return m_value == value; }
    bool operator!=(double value) const { return m_value != value; }
    bool operator<(double value) const { return m_value < value; }
    int Compare(double value) const;
    // Values less than a millisecond apart compare equal.
    static int CompareToMilisecondResolution(double a, double b);

    // The platform's text of the value in the locale.
    CString Format(DWORD flags, LCID locale) const;
    // The user's default locale, no flags.
    CString ToString() const;
    // strftime-style codes "aAbBcdHIjmMpSUwWxXyYzZ%", each with an optional
    // '#' that drops leading zeros (long forms for c and x).
    CString Format(const char* format) const;
    // The format is the program's string resource; COleException(E_FAIL)
    // when there is none.
    CString Format(UINT formatId) const;
    static bool ValidFormatString(const char* format);
    // The empty string when the format is not valid.
    CString TryFormat(const char* format) const;

    // The value changes only when the text parses.
    bool ParseDateTime(const char* text, DWORD flags, LCID locale);
    bool FromString(const char* text);

private:
    double m_value;
};

// The archive form is the value as a little-endian IEEE double.
VASKEL_API CArchive& operator<<(CArchive& archive, const CDateTime& dateTime);
VASKEL_API CArchive& operator>>(CArchive& archive, CDateTime& dateTime);

// A time of day as a fraction of a day, 0.0 being midnight and null. Most
// operations keep the fraction's sign (a plain fraction); the setters and
// the in-place shifts wrap a negative one into [0, 1).
class VASKEL_API CTime {
public:
    CTime() : m_value(0.0) {}
    CTime(double value);
    CTime(const CDateTime& dateTime);
    // The value stays 0.0 when the conversion rejects the fields.
    CTime(int hour, int minute, int second);
    CTime(const SYSTEMTIME& time);

    // Stores the number as it is, date part included.
    CTime& operator=(double value) {
        m_value = value;
        return *this;
    }
    void SetValue(double value);
    bool SetTime(int hour, int minute, int second);
    bool FromSystemTime(const SYSTEMTIME& time);

    bool IsNull() const { return m_value == 0.0; }
    void SetNull() { m_value = 0.0; }
    double GetValue() const { return m_value; }
    operator double() const { return m_value; }
    double& GetValueRef() { return m_value; }

    static CTime Now();
    void SetNow() { *this = Now(); }
    CDateTime ToDateTime() const { return CDateTime(m_value); }

    // These throw unexpected_error as CDateTime's do.
    DWORD GetHour() const { return ToDateTime().GetHour(); }
    DWORD GetMinute() const { return ToDateTime().GetMinute(); }
    DWORD GetSecond() const { return ToDateTime().GetSecond(); }
    DWORD GetMilliseconds() const { return ToDateTime().GetMilliseconds(); }
    SYSTEMTIME ToSystemTime() const { return ToDateTime().ToSystemTime(); }
    int GetMinuteOfTheDay() const { return CDateTime::GetMinuteOfTheDay(m_value); }
    static int GetMinuteOfTheDay(double value) { return CDateTime::GetMinuteOfTheDay(value); }

    // Wrap around midnight in both directions.
    void AddSeconds(int seconds);
    void AddMinutes(int minutes);

    CTime operator+(const CTimeSpan& span) const { return CTime(m_value + span.GetSpan()); }
    CTime operator-(const CTimeSpan& span) const { return CTime(m_value - span.GetSpan()); }
    CTime& operator+=(const CTimeSpan& span);
    CTime& operator-=(const CTimeSpan& span);
    CDateTime operator+(const CJulianDate& date) const;
    // Rounded to whole milliseconds.
    CTimeSpan operator-(const CTime& other) const { return CTimeSpan(m_value - other.m_value); }

    bool operator==(const CTime& other) const { return m_value == other.m_value; }
    bool operator!=(const CTime& other) const { return m_value != other.m_value; }
    bool operator<(const CTime& other) const { return m_value < other.m_value; }
    bool operator==(double value) const { return m_value == value; }
    bool operator!=(double value) const { return m_value != value; }
    bool operator<(double value) const { return m_value < value; }
    int Compare(double value) const { return ToDateTime().Compare(value); }

    // The value formatted as a date-time: date codes show 30 December 1899.
    CString Format(DWORD flags, LCID locale) const { return ToDateTime().Format(flags, locale); }
    CString Format(const char* format) const { return ToDateTime().Format(format); }
    CString Format(UINT formatId) const { return ToDateTime().Format(formatId); }
    CString ToString() const { return ToDateTime().ToString(); }

    // Keeps the time of day of the parsed date-time.
    bool ParseTime(const char* text, DWORD flags, LCID locale);
    bool FromString(const char* text);

private:
    double m_value;
};

} // namespace vaskel
