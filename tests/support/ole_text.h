// Wide text for tests that run with 16-bit characters of either kind
// (wchar_t on Windows, char16_t elsewhere).
#pragma once

#include <vaskel/win32.h>

#include <string>

namespace vaskel_test {

using OleString = std::basic_string<OLECHAR>;

// ASCII text widened unit by unit.
inline OleString Ole(const char* ascii) {
    OleString text;
    for (; *ascii; ++ascii)
        text.push_back(static_cast<OLECHAR>(*ascii));
    return text;
}

// A BSTR's whole length, embedded NULs included.
inline OleString Ole(BSTR text) {
    return OleString(text, SysStringLen(text));
}

} // namespace vaskel_test
