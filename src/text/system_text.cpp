#include <vaskel/text.h>

#include <vector>

namespace vaskel {

bool GetLocaleInfoA(DWORD locale, DWORD type, CString& out) {
    char buffer[256];
    int length = ::GetLocaleInfoA(locale, type, buffer, 255);
    if (length > 0) {
        out = buffer;
        return true;
    }
    if (GetLastError() != ERROR_INSUFFICIENT_BUFFER)
        return false;
    const int needed = ::GetLocaleInfoA(locale, type, nullptr, 0);
    if (needed <= 0)
        return false;
    std::vector<char> larger(static_cast<std::size_t>(needed) + 1);
    length = ::GetLocaleInfoA(locale, type, larger.data(), needed + 1);
    if (length <= 0)
        return false;
    out = larger.data();
    return true;
}

CString GetLocaleInfoA(DWORD locale, DWORD type) {
    CString out;
    GetLocaleInfoA(locale, type, out);
    return out;
}

bool GetCurrencyName(DWORD locale, CString& out) {
    return GetLocaleInfoA(locale, LOCALE_SENGCURRNAME, out);
}

CString GetCurrencyName(DWORD locale) {
    CString out;
    GetCurrencyName(locale, out);
    return out;
}

CString KXFormatErrorMessage(DWORD code) {
    char* text = nullptr;
    const DWORD length = FormatMessageA(
        FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_IGNORE_INSERTS | FORMAT_MESSAGE_FROM_SYSTEM,
        nullptr, code, MAKELANGID(LANG_NEUTRAL, SUBLANG_DEFAULT), reinterpret_cast<LPSTR>(&text), 0,
        nullptr);
    CString message;
    if (length > 0 && text)
        message = CString(text, static_cast<int>(length));
    if (text)
        LocalFree(text);
    return message;
}

} // namespace vaskel
