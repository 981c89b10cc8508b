// Variant dates as text and back, for the two locales this platform carries:
// en-US (also every default locale) and the invariant locale.
#include "oleaut/civil_date.h"

#include <vkwin32/oleauto.h>

#include <charconv>
#include <cstring>
#include <optional>
#include <utility>

using namespace vkw32;

namespace {

constexpr ULONG kBothParts = VAR_DATEVALUEONLY | VAR_TIMEVALUEONLY;

enum class Layout {
    kEnglishUs, // M/d/yyyy h:mm:ss tt
    kInvariant, // MM/dd/yyyy HH:mm:ss
};

std::optional<Layout> LayoutOf(LCID lcid) {
    constexpr LCID kEnglishUs =
        MAKELCID(MAKELANGID(LANG_ENGLISH, SUBLANG_ENGLISH_US), SORT_DEFAULT);
    switch (lcid) {
    case LOCALE_NEUTRAL:
    case LOCALE_USER_DEFAULT:
    case LOCALE_SYSTEM_DEFAULT:
    case kEnglishUs:
        return Layout::kEnglishUs;
    case LOCALE_INVARIANT:
        return Layout::kInvariant;
    default:
        return std::nullopt;
    }
}

// Texts are short and bounded ("12/31/9999 11:59:59 PM" is the longest), so
// they are built on the stack.
class TextBuilder {
public:
    void Char(char c) { text_[length_++] = static_cast<OLECHAR>(c); }
    void Text(const char* text) {
        while (*text)
            Char(*text++);
    }
    void Number(int value, int minDigits) {
        char digits[12];
        const int count =
            static_cast<int>(std::to_chars(digits, digits + sizeof digits, value).ptr - digits);
        for (int i = count; i < minDigits; ++i)
            Char('0');
        for (int i = 0; i < count; ++i)
            Char(digits[i]);
    }
    HRESULT ToBstr(BSTR* result) const {
        *result = SysAllocStringLen(text_, length_);
        return *result ? S_OK : E_OUTOFMEMORY;
    }

private:
    OLECHAR text_[32];
    UINT length_ = 0;
};

void AppendDate(TextBuilder& text, long long day, Layout layout) {
    const CivilDate date = CivilFromVariantDay(day);
    const int width = layout == Layout::kInvariant ? 2 : 1;
    text.Number(date.month, width);
    text.Char('/');
    text.Number(date.day, width);
    text.Char('/');
    text.Number(date.year, 1);
}

void AppendTime(TextBuilder& text, long long secondsOfDay, Layout layout) {
    const int hour = static_cast<int>(secondsOfDay / 3600);
    if (layout == Layout::kInvariant)
        text.Number(hour, 2);
    else
        text.Number(hour % 12 == 0 ? 12 : hour % 12, 1);
    text.Char(':');
    text.Number(static_cast<int>(secondsOfDay / 60 % 60), 2);
    text.Char(':');
    text.Number(static_cast<int>(secondsOfDay % 60), 2);
    if (layout == Layout::kEnglishUs)
        text.Text(hour < 12 ? " AM" : " PM");
}

// Parsing. The text is read left to right through a cursor that moves only
// over characters some rule accepts; the terminating NUL is accepted by
// none, so nothing past it is ever read, and nothing is allocated.

// Nine digits always fit an int; a longer run is too long for any field.
constexpr int kMaxDigits = 9;

bool IsDigit(OLECHAR c) {
    return c >= '0' && c <= '9';
}

bool IsLetter(OLECHAR c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

// Tabs and the no-break and ideographic spaces count as blanks too: they
// turn up between the fields of texts copied from elsewhere.
bool IsBlank(OLECHAR c) {
    return c == ' ' || c == '\t' || c == 0x00A0 || c == 0x202F || c == 0x3000;
}

// A run of digits. Only the first kMaxDigits count towards the value; a
// longer run shows as a digit count past kMaxDigits.
struct Number {
    int value = 0;
    int digits = 0;
};

struct Word {
    const OLECHAR* text = nullptr;
    int length = 0; // capped just past the longest name
};

class Cursor {
public:
    explicit Cursor(const OLECHAR* text) : at_(text) {}

    bool AtEnd() const { return *at_ == 0; }
    bool NextIsLetter() const { return IsLetter(*at_); }
    const OLECHAR* Mark() const { return at_; }
    void Reset(const OLECHAR* mark) { at_ = mark; }

    bool Take(char c) {
        if (*at_ != static_cast<OLECHAR>(c))
            return false;
        ++at_;
        return true;
    }

    bool SkipBlanks() {
        const OLECHAR* start = at_;
        while (IsBlank(*at_))
            ++at_;
        return at_ != start;
    }

    bool ReadNumber(Number* number) {
        if (!IsDigit(*at_))
            return false;
        Number n;
        for (; IsDigit(*at_); ++at_) {
            if (n.digits < kMaxDigits)
                n.value = n.value * 10 + (*at_ - '0');
            if (n.digits <= kMaxDigits)
                ++n.digits;
        }
        *number = n;
        return true;
    }

    // A number of one or two digits, as days, months and times are written.
    bool ReadSmallNumber(Number* number) { return ReadNumber(number) && number->digits <= 2; }

    Word ReadWord() {
        Word word{at_, 0};
        for (; IsLetter(*at_); ++at_) {
            if (word.length <= kMaxNameLength)
                ++word.length;
        }
        return word;
    }

    static constexpr int kMaxNameLength = 9; // "September", "Wednesday"

private:
    const OLECHAR* at_;
};

OLECHAR Lower(OLECHAR c) {
    return c >= 'A' && c <= 'Z' ? static_cast<OLECHAR>(c + ('a' - 'A')) : c;
}

// Whether the word is the first `length` letters of a lower-case name, in
// any case.
bool WordMatches(const Word& word, const char* lowerCase, int length) {
    if (word.length != length)
        return false;
    for (int i = 0; i < length; ++i) {
        if (Lower(word.text[i]) != static_cast<OLECHAR>(lowerCase[i]))
            return false;
    }
    return true;
}

bool WordIs(const Word& word, const char* lowerCase) {
    return WordMatches(word, lowerCase, static_cast<int>(std::strlen(lowerCase)));
}

// 1-based position among the names of the word, written in full or as its
// first three letters; 0 when it is none of them.
template <int N>
int FindName(const Word& word, const char* const (&names)[N]) {
    for (int i = 0; i < N; ++i) {
        if (WordIs(word, names[i]) || WordMatches(word, names[i], 3))
            return i + 1;
    }
    return 0;
}

const char* const kMonthNames[] = {"january",   "february", "march",    "april",
                                   "may",       "june",     "july",     "august",
                                   "september", "october",  "november", "december"};
const char* const kWeekdayNames[] = {"sunday",   "monday", "tuesday", "wednesday",
                                     "thursday", "friday", "saturday"};

enum class Meridiem { kNone, kAm, kPm };

Meridiem MeridiemOf(const Word& word) {
    if (WordIs(word, "am") || WordIs(word, "a"))
        return Meridiem::kAm;
    if (WordIs(word, "pm") || WordIs(word, "p"))
        return Meridiem::kPm;
    return Meridiem::kNone;
}

// The fields as written; their values are checked once the whole text has
// been read, so that a malformed text is a mismatch whatever its numbers.
struct DateFields {
    Number month; // a named month is stored as its number
    Number day;
    Number year;
};

struct TimeFields {
    Number hour;
    Number minute;
    Number second;
    Meridiem meridiem = Meridiem::kNone;
};

Number NamedMonth(int month) {
    Number number;
    number.value = month;
    number.digits = 1;
    return number;
}

class Parser {
public:
    explicit Parser(const OLECHAR* text) : cursor_(text) {}

    // Reads the whole text: an optional date, an optional time, not neither.
    bool Read(std::optional<DateFields>* date, std::optional<TimeFields>* time) {
        cursor_.SkipBlanks();
        if (StartsWithTime()) {
            time->emplace();
            if (!ReadTime(&**time))
                return false;
        } else {
            date->emplace();
            bool yearFirst = false;
            if (!ReadDate(&**date, &yearFirst))
                return false;
            const bool blank = cursor_.SkipBlanks();
            if (!cursor_.AtEnd()) {
                // Year-first dates take the ISO 'T' before the time.
                if (!blank && !(yearFirst && cursor_.Take('T')))
                    return false;
                time->emplace();
                if (!ReadTime(&**time))
                    return false;
            }
        }
        cursor_.SkipBlanks();
        return cursor_.AtEnd();
    }

private:
    // A time starts with its hour and a colon or an AM/PM designator.
    bool StartsWithTime() {
        const OLECHAR* mark = cursor_.Mark();
        Number hour;
        bool time = false;
        if (cursor_.ReadNumber(&hour)) {
            time = cursor_.Take(':');
            if (!time) {
                cursor_.SkipBlanks();
                time = MeridiemOf(cursor_.ReadWord()) != Meridiem::kNone;
            }
        }
        cursor_.Reset(mark);
        return time;
    }

    bool ReadTime(TimeFields* time) {
        if (!cursor_.ReadSmallNumber(&time->hour))
            return false;
        bool minutes = false;
        if (cursor_.Take(':')) {
            minutes = true;
            if (!cursor_.ReadSmallNumber(&time->minute))
                return false;
            if (cursor_.Take(':')) {
                if (!cursor_.ReadSmallNumber(&time->second))
                    return false;
            }
        }
        const OLECHAR* mark = cursor_.Mark();
        cursor_.SkipBlanks();
        time->meridiem = MeridiemOf(cursor_.ReadWord());
        if (time->meridiem == Meridiem::kNone)
            cursor_.Reset(mark);
        // A bare number is no time.
        return minutes || time->meridiem != Meridiem::kNone;
    }

    // A separator between the fields of a written-out date: a comma, blanks
    // or both.
    bool ReadNameSeparator() {
        const bool comma = cursor_.Take(',');
        const bool blank = cursor_.SkipBlanks();
        return comma || blank;
    }

    bool ReadDate(DateFields* date, bool* yearFirst) {
        Word word = cursor_.ReadWord();
        if (FindName(word, kWeekdayNames)) {
            // The weekday is read past, not checked against the date.
            if (!ReadNameSeparator())
                return false;
            word = cursor_.ReadWord();
        }
        if (word.length > 0) {
            // February 29, 2024 / Feb 29 2024
            const int month = FindName(word, kMonthNames);
            if (!month || !cursor_.SkipBlanks() || !cursor_.ReadSmallNumber(&date->day) ||
                !ReadNameSeparator())
                return false;
            date->month = NamedMonth(month);
            return cursor_.ReadNumber(&date->year);
        }
        Number first;
        if (!cursor_.ReadNumber(&first))
            return false;
        if (cursor_.SkipBlanks())
            return ReadMonthNameAndYear(first, ',', date); // 29 February 2024
        const bool slash = cursor_.Take('/');
        if (!slash && !cursor_.Take('-'))
            return false;
        if (!slash && cursor_.NextIsLetter())
            return ReadMonthNameAndYear(first, '-', date); // 29-Feb-2024
        // Numbers: year first (2024-02-29) when the first is written with
        // three digits or more, else month first (2/29/2024).
        const char separator = slash ? '/' : '-';
        Number second, third;
        if (!cursor_.ReadNumber(&second) || !cursor_.Take(separator) || !cursor_.ReadNumber(&third))
            return false;
        *yearFirst = first.digits >= 3;
        if (*yearFirst) {
            date->year = first;
            date->month = second;
            date->day = third;
        } else {
            date->month = first;
            date->day = second;
            date->year = third;
        }
        return date->month.digits <= 2 && date->day.digits <= 2;
    }

    // The month name and year after a day; '-' asks for dashes around the
    // name, ',' for blanks before it and a comma, blanks or both after it.
    bool ReadMonthNameAndYear(const Number& day, char separator, DateFields* date) {
        const int month = FindName(cursor_.ReadWord(), kMonthNames);
        if (!month || day.digits > 2)
            return false;
        if (separator == '-' ? !cursor_.Take('-') : !ReadNameSeparator())
            return false;
        date->day = day;
        date->month = NamedMonth(month);
        return cursor_.ReadNumber(&date->year);
    }

    Cursor cursor_;
};

// Two-digit years fall in 1930-2029; years written out must lie in 100-9999.
HRESULT ResolveYear(const Number& year, int* result) {
    if (year.digits <= 2) {
        *result = year.value + (year.value < 30 ? 2000 : 1900);
        return S_OK;
    }
    if (year.digits > kMaxDigits || year.value < 100 || year.value > 9999)
        return DISP_E_OVERFLOW;
    *result = year.value;
    return S_OK;
}

HRESULT ResolveDate(const DateFields& fields, long long* day) {
    int month = fields.month.value;
    int dayOfMonth = fields.day.value;
    // A first number that cannot be a month is the day: 13/1/2024 is
    // 13 January, as the system reads it.
    if (month > 12 && dayOfMonth <= 12)
        std::swap(month, dayOfMonth);
    if (month < 1 || month > 12 || dayOfMonth < 1 || dayOfMonth > 31)
        return DISP_E_TYPEMISMATCH;
    int year = 0;
    const HRESULT hr = ResolveYear(fields.year, &year);
    if (FAILED(hr))
        return hr;
    // Days past the end of the month are refused, never carried over.
    if (dayOfMonth > DaysInMonth(year, month))
        return DISP_E_TYPEMISMATCH;
    *day = VariantDayFromCivil(year, month, dayOfMonth);
    return S_OK;
}

HRESULT ResolveTime(const TimeFields& fields, long long* seconds) {
    int hour = fields.hour.value;
    // 12 AM is midnight, 12 PM noon; 0 reads as 12. An hour past 12 is
    // already on the 24-hour clock, and the designator is ignored.
    if (fields.meridiem != Meridiem::kNone && hour <= 12)
        hour = hour % 12 + (fields.meridiem == Meridiem::kPm ? 12 : 0);
    if (hour > 23 || fields.minute.value > 59 || fields.second.value > 59)
        return DISP_E_TYPEMISMATCH;
    *seconds = hour * 3600LL + fields.minute.value * 60LL + fields.second.value;
    return S_OK;
}

HRESULT ParseText(const OLECHAR* text, ULONG flags, DATE* result) {
    std::optional<DateFields> date;
    std::optional<TimeFields> time;
    if (!Parser(text).Read(&date, &time))
        return DISP_E_TYPEMISMATCH;
    long long day = 0;
    long long seconds = 0;
    HRESULT hr = S_OK;
    if (date)
        hr = ResolveDate(*date, &day);
    if (SUCCEEDED(hr) && time)
        hr = ResolveTime(*time, &seconds);
    if (FAILED(hr))
        return hr;
    if (flags & VAR_TIMEVALUEONLY)
        day = 0;
    if (flags & VAR_DATEVALUEONLY)
        seconds = 0;
    return MakeVariantTime(day, seconds, result) ? S_OK : DISP_E_OVERFLOW;
}

} // namespace

extern "C" {

HRESULT WINAPI VarBstrFromDate(DATE dateIn, LCID lcid, ULONG flags, BSTR* result) {
    if (!result)
        return E_INVALIDARG;
    *result = nullptr;
    const std::optional<Layout> layout = LayoutOf(lcid);
    const ULONG only = flags & kBothParts;
    long long day = 0;
    long long seconds = 0;
    if (!layout || only == kBothParts || !SplitVariantTime(dateIn, &day, &seconds))
        return E_INVALIDARG;
    // Unasked, day 0 prints as a time alone and midnight as a date alone;
    // both are judged after rounding to the second, as the text shows it.
    const bool showDate = only ? only == VAR_DATEVALUEONLY : day != 0;
    const bool showTime = only ? only == VAR_TIMEVALUEONLY : seconds != 0 || day == 0;
    TextBuilder text;
    if (showDate)
        AppendDate(text, day, *layout);
    if (showDate && showTime)
        text.Char(' ');
    if (showTime)
        AppendTime(text, seconds, *layout);
    return text.ToBstr(result);
}

HRESULT WINAPI VarDateFromStr(LPCOLESTR text, LCID lcid, ULONG flags, DATE* result) {
    if (!result || !LayoutOf(lcid) || (flags & kBothParts) == kBothParts)
        return E_INVALIDARG;
    if (!text)
        return DISP_E_TYPEMISMATCH;
    DATE value = 0.0;
    const HRESULT hr = ParseText(text, flags, &value);
    if (SUCCEEDED(hr))
        *result = value;
    return hr;
}

} // extern "C"
