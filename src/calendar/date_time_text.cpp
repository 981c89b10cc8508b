#include <vaskel/calendar.h>
#include <vaskel/framework/exceptions.h>

#include <cstring>
#include <ctime>
#include <string>

namespace vaskel {
namespace {

const UINT invalidDateTimeResource = 55296;
const int formatBufferSize = 256;
const char conversionCodes[] = "aAbBcdHIjmMpSUwWxXyYzZ%";
// Codes whose '#' form drops leading zeros.
const char numericCodes[] = "dHIjmMSUwWyY";

// The program's string resource, or false when it has none.
bool LoadResourceText(UINT id, CString& text) {
    char buffer[formatBufferSize];
    const int length = LoadStringA(GetModuleHandleA(nullptr), id, buffer, formatBufferSize);
    if (length <= 0)
        return false;
    text = CString(buffer, length);
    return true;
}

CString InvalidDateTimeText() {
    CString text;
    if (!LoadResourceText(invalidDateTimeResource, text))
        text = "Invalid DateTime";
    return text;
}

int DayOfYear(const SYSTEMTIME& time) {
    static const int daysBefore[] = {0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
    int day = daysBefore[time.wMonth - 1] + time.wDay;
    if (time.wMonth > 2 && CDateTime::IsLeapYear(time.wYear))
        ++day;
    return day;
}

// Appends one conversion. Each code goes to strftime on its own, so that
// the '#' flag means the same on every runtime and an unknown code never
// reaches it.
void AppendConversion(std::string& out, const struct tm& broken, char code, bool alternate) {
    char format[4] = {'%', 0, 0, 0};
    // '#' asks for the long forms of the date and the date and time.
    if (alternate && (code == 'c' || code == 'x')) {
        format[1] = '#';
        format[2] = code;
    } else {
        // The time-zone name for both zone codes, as the runtime the format
        // language comes from gives it.
        format[1] = code == 'z' ? 'Z' : code;
    }
    char buffer[formatBufferSize];
    const std::size_t length = std::strftime(buffer, sizeof buffer, format, &broken);
    std::size_t start = 0;
    if (alternate && std::strchr(numericCodes, code)) {
        while (start + 1 < length && buffer[start] == '0')
            ++start;
    }
    out.append(buffer + start, length - start);
}

} // namespace

CString CDateTime::Format(DWORD flags, LCID locale) const {
    BSTR text = nullptr;
    if (FAILED(VarBstrFromDate(m_value, locale, flags, &text)))
        return InvalidDateTimeText();
    CString result(text, static_cast<int>(SysStringLen(text)));
    SysFreeString(text);
    return result;
}

CString CDateTime::ToString() const {
    return Format(0, LOCALE_USER_DEFAULT);
}

CString CDateTime::Format(const char* format) const {
    SYSTEMTIME time = {};
    if (!ToSystemTime(time))
        return InvalidDateTimeText();
    if (!format)
        return CString();
    struct tm broken = {};
    broken.tm_sec = time.wSecond;
    broken.tm_min = time.wMinute;
    broken.tm_hour = time.wHour;
    broken.tm_mday = time.wDay;
    broken.tm_mon = time.wMonth - 1;
    broken.tm_year = time.wYear - 1900;
    broken.tm_wday = time.wDayOfWeek;
    broken.tm_yday = DayOfYear(time) - 1;
    broken.tm_isdst = 0;

    std::string out;
    for (const char* p = format; *p;) {
        if (*p != '%') {
            out += *p++;
            continue;
        }
        const char* conversion = p + 1;
        const bool alternate = *conversion == '#';
        if (alternate)
            ++conversion;
        const char code = *conversion;
        if (code == '\0' || !std::strchr(conversionCodes, code)) {
            // Not a conversion: kept as it stands.
            out.append(p, conversion - p);
            p = conversion;
            continue;
        }
        AppendConversion(out, broken, code, alternate);
        p = conversion + 1;
    }
    if (out.size() > formatBufferSize - 1)
        out.resize(formatBufferSize - 1);
    return CString(out.c_str(), static_cast<int>(out.size()));
}

CString CDateTime::Format(UINT formatId) const {
    CString format;
    if (!LoadResourceText(formatId, format))
        AfxThrowOleException(E_FAIL);
    return Format(static_cast<const char*>(format));
}

bool CDateTime::ValidFormatString(const char* format) {
    if (!format || !*format)
        return false;
    for (const char* p = std::strchr(format, '%'); p; p = std::strchr(p, '%')) {
        ++p;
        if (*p == '#')
            ++p;
        if (*p == '\0' || !std::strchr(conversionCodes, *p))
            return false;
        ++p;
    }
    return true;
}

CString CDateTime::TryFormat(const char* format) const {
    return ValidFormatString(format) ? Format(format) : CString();
}

bool CDateTime::ParseDateTime(const char* text, DWORD flags, LCID locale) {
    if (!text)
        text = "";
    const int length = MultiByteToWideChar(CP_THREAD_ACP, 0, text, -1, nullptr, 0);
    if (length <= 0)
        return false;
    std::basic_string<WCHAR> wide(static_cast<std::size_t>(length), WCHAR());
    if (MultiByteToWideChar(CP_THREAD_ACP, 0, text, -1, &wide[0], length) != length)
        return false;
    DATE parsed = 0.0;
    if (FAILED(VarDateFromStr(&wide[0], locale, flags, &parsed)))
        return false;
    m_value = parsed;
    return true;
}

bool CDateTime::FromString(const char* text) {
    return ParseDateTime(text, 0, LOCALE_USER_DEFAULT);
}

} // namespace vaskel
