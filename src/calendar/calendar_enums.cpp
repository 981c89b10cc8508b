#include <vaskel/calendar.h>

#include <cstring>

namespace vaskel {
namespace {

struct Name {
    const char* full;
    const char* brief;
};

const Name kMonthNames[] = {
    {"January", "Jan"},   {"February", "Feb"}, {"March", "Mar"},    {"April", "Apr"},
    {"May", "May"},       {"June", "Jun"},     {"July", "Jul"},     {"August", "Aug"},
    {"September", "Sep"}, {"October", "Oct"},  {"November", "Nov"}, {"December", "Dec"},
};

const Name kDayNames[] = {
    {"Sunday", "Sun"},   {"Monday", "Mon"}, {"Tuesday", "Tue"},  {"Wednesday", "Wed"},
    {"Thursday", "Thu"}, {"Friday", "Fri"}, {"Saturday", "Sat"},
};

const Name kInvalidName = {"Invalid", "Inv"};

template <size_t N>
const char* PickName(const Name (&names)[N], int value, bool fullName) {
    const Name& name = value >= 0 && static_cast<size_t>(value) < N ? names[value] : kInvalidName;
    return fullName ? name.full : name.brief;
}

// ASCII only: names are English, and the result must not depend on the
// process locale.
char LowerAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

// Compares at most length bytes, stopping at the first difference or where
// both end; the text is never read past its first NUL or the length.
bool StartsLikeNoCase(const char* text, const char* name, size_t length) {
    for (size_t i = 0; i < length; ++i) {
        if (LowerAscii(text[i]) != LowerAscii(name[i]))
            return false;
        if (name[i] == '\0')
            return true;
    }
    return true;
}

// The whole text equals the name: the comparison includes the name's NUL.
bool EqualsNoCase(const char* text, const char* name) {
    return StartsLikeNoCase(text, name, std::strlen(name) + 1);
}

} // namespace

const char* CalendarMonthX::ToString(ECalendarMonth month, bool fullName) {
    return PickName(kMonthNames, month, fullName);
}

ECalendarMonth CalendarMonthX::GetMonth(int month) {
    return month >= January && month <= December ? static_cast<ECalendarMonth>(month)
                                                 : InvalidMonth;
}

ECalendarMonth CalendarMonthX::GetMonthOneBased(int month) {
    return month >= 1 && month <= 12 ? static_cast<ECalendarMonth>(month - 1) : InvalidMonth;
}

ECalendarMonth CalendarMonthX::GetMonth(const SYSTEMTIME& time) {
    return GetMonthOneBased(time.wMonth);
}

const char* DayOfWeekX::ToString(EDayOfWeek day, bool fullName) {
    return PickName(kDayNames, day, fullName);
}

EDayOfWeek DayOfWeekX::GetDay(int day) {
    return day >= Sunday && day <= Saturday ? static_cast<EDayOfWeek>(day) : InvalidDay;
}

EDayOfWeek DayOfWeekX::Next(EDayOfWeek day) {
    if (day == InvalidDay)
        return Sunday;
    return day >= Sunday && day < Saturday ? static_cast<EDayOfWeek>(day + 1) : InvalidDay;
}

EDayOfWeek DayOfWeekX::FromString(const char* text) {
    if (!text)
        return InvalidDay;
    for (int day = Sunday; day <= Saturday; ++day) {
        if (EqualsNoCase(text, kDayNames[day].full) || EqualsNoCase(text, kDayNames[day].brief))
            return static_cast<EDayOfWeek>(day);
    }
    return InvalidDay;
}

EDayOfWeek DayOfWeekX::FromString(const char* text, DWORD length) {
    // An empty prefix would match every name: it names no day.
    if (!text || length == 0)
        return InvalidDay;
    for (int day = Sunday; day <= Saturday; ++day) {
        const Name& name = kDayNames[day];
        if (StartsLikeNoCase(text, length < 4 ? name.brief : name.full, length))
            return static_cast<EDayOfWeek>(day);
    }
    return InvalidDay;
}

} // namespace vaskel
