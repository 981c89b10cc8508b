// Locale information for the two locales this platform knows: en-US, which
// is also the user's, the system's and the neutral locale here, and the
// invariant locale. The values are those the system gives for them.
#include <vkwin32/kernel.h>
#include <vkwin32/winnls.h>

#include <cstdlib>
#include <cstring>

namespace {

constexpr LCID kEnglishUs = MAKELCID(MAKELANGID(LANG_ENGLISH, SUBLANG_ENGLISH_US), SORT_DEFAULT);
constexpr LCTYPE kUseAnsiCodePage = 0x40000000u; // LOCALE_USE_CP_ACP: the A form always does
constexpr LCTYPE kFlags = LOCALE_NOUSEROVERRIDE | LOCALE_RETURN_NUMBER | kUseAnsiCodePage;

enum class Kind { kText, kDecimal, kHex };

struct Entry {
    LCTYPE type;
    Kind kind;
    const char* englishUs;
    const char* invariant;
};

constexpr Entry kEntries[] = {
    {LOCALE_ILANGUAGE, Kind::kHex, "0409", "007f"},
    {LOCALE_SLANGUAGE, Kind::kText, "English (United States)",
     "Invariant Language (Invariant Country)"},
    {LOCALE_SENGLANGUAGE, Kind::kText, "English", "Invariant Language"},
    {LOCALE_SNATIVELANGNAME, Kind::kText, "English", "Invariant Language"},
    {LOCALE_SABBREVLANGNAME, Kind::kText, "ENU", "IVL"},
    {LOCALE_SENGCOUNTRY, Kind::kText, "United States", "Invariant Country"},
    {LOCALE_SNATIVECTRYNAME, Kind::kText, "United States", "Invariant Country"},
    {LOCALE_SISO639LANGNAME, Kind::kText, "en", "iv"},
    {LOCALE_SISO3166CTRYNAME, Kind::kText, "US", "IV"},
    {LOCALE_SNAME, Kind::kText, "en-US", ""},
    {LOCALE_IDEFAULTCODEPAGE, Kind::kDecimal, "437", "437"},
    {LOCALE_IDEFAULTANSICODEPAGE, Kind::kDecimal, "1252", "1252"},
    {LOCALE_SLIST, Kind::kText, ",", ","},
    {LOCALE_IMEASURE, Kind::kDecimal, "1", "0"},
    {LOCALE_SDECIMAL, Kind::kText, ".", "."},
    {LOCALE_STHOUSAND, Kind::kText, ",", ","},
    {LOCALE_SGROUPING, Kind::kText, "3;0", "3;0"},
    {LOCALE_IDIGITS, Kind::kDecimal, "2", "2"},
    {LOCALE_ILZERO, Kind::kDecimal, "1", "1"},
    {LOCALE_SNATIVEDIGITS, Kind::kText, "0123456789", "0123456789"},
    // The generic currency sign, in the ANSI code page (UTF-8 here).
    {LOCALE_SCURRENCY, Kind::kText, "$", "\xC2\xA4"},
    {LOCALE_SINTLSYMBOL, Kind::kText, "USD", "XDR"},
    {LOCALE_SENGCURRNAME, Kind::kText, "US Dollar", "International Monetary Fund"},
    {LOCALE_SNATIVECURRNAME, Kind::kText, "US Dollar", "International Monetary Fund"},
    {LOCALE_SMONDECIMALSEP, Kind::kText, ".", "."},
    {LOCALE_SMONTHOUSANDSEP, Kind::kText, ",", ","},
    {LOCALE_SMONGROUPING, Kind::kText, "3;0", "3;0"},
    {LOCALE_ICURRDIGITS, Kind::kDecimal, "2", "2"},
    {LOCALE_ICURRENCY, Kind::kDecimal, "0", "0"},
    {LOCALE_INEGCURR, Kind::kDecimal, "0", "0"},
    {LOCALE_SPOSITIVESIGN, Kind::kText, "", "+"},
    {LOCALE_SNEGATIVESIGN, Kind::kText, "-", "-"},
    {LOCALE_SDATE, Kind::kText, "/", "/"},
    {LOCALE_STIME, Kind::kText, ":", ":"},
    {LOCALE_SSHORTDATE, Kind::kText, "M/d/yyyy", "MM/dd/yyyy"},
    {LOCALE_SLONGDATE, Kind::kText, "dddd, MMMM d, yyyy", "dddd, dd MMMM yyyy"},
    {LOCALE_STIMEFORMAT, Kind::kText, "h:mm:ss tt", "HH:mm:ss"},
    {LOCALE_SYEARMONTH, Kind::kText, "MMMM yyyy", "yyyy MMMM"},
    {LOCALE_IDATE, Kind::kDecimal, "0", "0"},
    {LOCALE_ILDATE, Kind::kDecimal, "0", "1"},
    {LOCALE_ITIME, Kind::kDecimal, "0", "1"},
    {LOCALE_ICENTURY, Kind::kDecimal, "1", "1"},
    {LOCALE_ITLZERO, Kind::kDecimal, "0", "1"},
    {LOCALE_IFIRSTDAYOFWEEK, Kind::kDecimal, "6", "6"},
    {LOCALE_S1159, Kind::kText, "AM", "AM"},
    {LOCALE_S2359, Kind::kText, "PM", "PM"},
};

// Day and month names are the same in both locales.
constexpr const char* kDayNames[] = {"Monday", "Tuesday",  "Wednesday", "Thursday",
                                     "Friday", "Saturday", "Sunday"};
constexpr const char* kAbbreviatedDayNames[] = {"Mon", "Tue", "Wed", "Thu", "Fri", "Sat", "Sun"};
constexpr const char* kMonthNames[] = {"January",   "February", "March",    "April",
                                       "May",       "June",     "July",     "August",
                                       "September", "October",  "November", "December"};
constexpr const char* kAbbreviatedMonthNames[] = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                                  "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};

bool Lookup(LCTYPE type, bool invariant, const char*& text, Kind& kind) {
    kind = Kind::kText;
    if (type >= LOCALE_SDAYNAME1 && type <= LOCALE_SDAYNAME7) {
        text = kDayNames[type - LOCALE_SDAYNAME1];
        return true;
    }
    if (type >= LOCALE_SABBREVDAYNAME1 && type <= LOCALE_SABBREVDAYNAME7) {
        text = kAbbreviatedDayNames[type - LOCALE_SABBREVDAYNAME1];
        return true;
    }
    if (type >= LOCALE_SMONTHNAME1 && type <= LOCALE_SMONTHNAME12) {
        text = kMonthNames[type - LOCALE_SMONTHNAME1];
        return true;
    }
    if (type >= LOCALE_SABBREVMONTHNAME1 && type <= LOCALE_SABBREVMONTHNAME12) {
        text = kAbbreviatedMonthNames[type - LOCALE_SABBREVMONTHNAME1];
        return true;
    }
    for (const Entry& entry : kEntries) {
        if (entry.type == type) {
            text = invariant ? entry.invariant : entry.englishUs;
            kind = entry.kind;
            return true;
        }
    }
    return false;
}

INT Fail(DWORD error) {
    SetLastError(error);
    return 0;
}

} // namespace

extern "C" INT WINAPI GetLocaleInfoA(LCID locale, LCTYPE type, LPSTR data, INT size) {
    bool invariant = false;
    switch (locale) {
    case LOCALE_NEUTRAL:
    case LOCALE_USER_DEFAULT:
    case LOCALE_SYSTEM_DEFAULT:
    case kEnglishUs:
        break;
    case LOCALE_INVARIANT:
        invariant = true;
        break;
    default:
        return Fail(ERROR_INVALID_PARAMETER);
    }
    if (size < 0 || (size > 0 && !data))
        return Fail(ERROR_INVALID_PARAMETER);
    const char* text = nullptr;
    Kind kind = Kind::kText;
    if (!Lookup(type & ~kFlags, invariant, text, kind))
        return Fail(ERROR_INVALID_FLAGS);

    if (type & LOCALE_RETURN_NUMBER) {
        if (kind == Kind::kText)
            return Fail(ERROR_INVALID_FLAGS);
        // The number is a DWORD, counted in characters of the A form.
        const INT needed = static_cast<INT>(sizeof(DWORD));
        if (size == 0)
            return needed;
        if (size < needed)
            return Fail(ERROR_INSUFFICIENT_BUFFER);
        const DWORD number =
            static_cast<DWORD>(std::strtoul(text, nullptr, kind == Kind::kHex ? 16 : 10));
        std::memcpy(data, &number, sizeof number);
        return needed;
    }

    const INT needed = static_cast<INT>(std::strlen(text)) + 1;
    if (size == 0)
        return needed;
    if (size < needed)
        return Fail(ERROR_INSUFFICIENT_BUFFER);
    std::memcpy(data, text, static_cast<std::size_t>(needed));
    return needed;
}
