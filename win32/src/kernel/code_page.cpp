// Code-page conversions. The ANSI, OEM and thread code pages are UTF-8 here;
// malformed input becomes U+FFFD per maximal ill-formed subsequence, as the
// Unicode standard recommends and Windows does.
#include "kernel/utf8.h"

#include <vkwin32/kernel.h>

#include <climits>
#include <cstring>

namespace {

const char16_t replacement = 0xFFFD;

bool IsUtf8CodePage(UINT codePage) {
    return codePage == CP_ACP || codePage == CP_OEMCP || codePage == CP_THREAD_ACP ||
           codePage == CP_UTF8;
}

int Utf16Units(char32_t cp) {
    return cp >= 0x10000 ? 2 : 1;
}

} // namespace

extern "C" UINT WINAPI GetACP(void) {
    return CP_UTF8;
}

extern "C" int WINAPI MultiByteToWideChar(UINT codePage, DWORD flags, LPCSTR multiByteStr,
                                          int multiByteCount, LPWSTR wideCharStr,
                                          int wideCharCount) {
    // Any negative length means up to and including the NUL, as on Windows.
    if (multiByteStr == nullptr || multiByteCount == 0 || wideCharCount < 0 ||
        (wideCharStr == nullptr && wideCharCount != 0) ||
        static_cast<const void*>(multiByteStr) == static_cast<const void*>(wideCharStr) ||
        !IsUtf8CodePage(codePage)) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    if ((flags & ~static_cast<DWORD>(MB_ERR_INVALID_CHARS)) != 0) {
        SetLastError(ERROR_INVALID_FLAGS);
        return 0;
    }
    size_t measured = multiByteCount < 0 ? std::strlen(multiByteStr) + 1 : 0;
    if (measured > static_cast<size_t>(INT_MAX)) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    int length = multiByteCount < 0 ? static_cast<int>(measured) : multiByteCount;
    const auto* text = reinterpret_cast<const unsigned char*>(multiByteStr);
    int needed = 0;
    bool overflow = false;
    for (int i = 0; i < length;) {
        // ASCII, by far the most common text, maps byte for unit.
        if (text[i] < 0x80) {
            if (wideCharCount != 0) {
                if (needed >= wideCharCount) {
                    overflow = true;
                    break;
                }
                wideCharStr[needed] = static_cast<char16_t>(text[i]);
            }
            ++needed;
            ++i;
            continue;
        }
        char32_t cp;
        if (!vkw32::DecodeUtf8(text, length, i, cp)) {
            if (flags & MB_ERR_INVALID_CHARS) {
                SetLastError(ERROR_NO_UNICODE_TRANSLATION);
                return 0;
            }
            cp = replacement;
        }
        int units = Utf16Units(cp);
        if (wideCharCount != 0) {
            if (needed + units > wideCharCount) {
                overflow = true;
                break;
            }
            if (units == 2) {
                cp -= 0x10000;
                wideCharStr[needed] = static_cast<char16_t>(0xD800 + (cp >> 10));
                wideCharStr[needed + 1] = static_cast<char16_t>(0xDC00 + (cp & 0x3FF));
            } else {
                wideCharStr[needed] = static_cast<char16_t>(cp);
            }
        }
        needed += units;
    }
    if (overflow) {
        SetLastError(ERROR_INSUFFICIENT_BUFFER);
        return 0;
    }
    return needed;
}

extern "C" int WINAPI WideCharToMultiByte(UINT codePage, DWORD flags, LPCWSTR wideCharStr,
                                          int wideCharCount, LPSTR multiByteStr, int multiByteCount,
                                          LPCSTR defaultChar, LPBOOL usedDefaultChar) {
    if (wideCharStr == nullptr || wideCharCount == 0 || multiByteCount < 0 ||
        (multiByteStr == nullptr && multiByteCount != 0) ||
        static_cast<const void*>(multiByteStr) == static_cast<const void*>(wideCharStr) ||
        !IsUtf8CodePage(codePage) ||
        (codePage == CP_UTF8 && (defaultChar != nullptr || usedDefaultChar != nullptr))) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    if (codePage == CP_UTF8 && (flags & ~static_cast<DWORD>(WC_ERR_INVALID_CHARS)) != 0) {
        SetLastError(ERROR_INVALID_FLAGS);
        return 0;
    }
    if (usedDefaultChar)
        *usedDefaultChar = FALSE; // every character has a UTF-8 form
    int length = wideCharCount;
    if (length < 0) {
        length = 0;
        while (wideCharStr[length] != 0) {
            if (length == INT_MAX - 1) {
                SetLastError(ERROR_INVALID_PARAMETER);
                return 0;
            }
            ++length;
        }
        ++length;
    }
    int needed = 0;
    bool overflow = false;
    for (int i = 0; i < length;) {
        char32_t cp = wideCharStr[i++];
        if (cp >= 0xD800 && cp <= 0xDBFF && i < length && wideCharStr[i] >= 0xDC00 &&
            wideCharStr[i] <= 0xDFFF) {
            cp = 0x10000 + ((cp - 0xD800) << 10) + (wideCharStr[i++] - 0xDC00);
        } else if (cp >= 0xD800 && cp <= 0xDFFF) {
            if (flags & WC_ERR_INVALID_CHARS) {
                SetLastError(ERROR_NO_UNICODE_TRANSLATION);
                return 0;
            }
            cp = replacement;
        }
        char bytes[4];
        int count;
        if (cp < 0x80) {
            bytes[0] = static_cast<char>(cp);
            count = 1;
        } else if (cp < 0x800) {
            bytes[0] = static_cast<char>(0xC0 | (cp >> 6));
            bytes[1] = static_cast<char>(0x80 | (cp & 0x3F));
            count = 2;
        } else if (cp < 0x10000) {
            bytes[0] = static_cast<char>(0xE0 | (cp >> 12));
            bytes[1] = static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
            bytes[2] = static_cast<char>(0x80 | (cp & 0x3F));
            count = 3;
        } else {
            bytes[0] = static_cast<char>(0xF0 | (cp >> 18));
            bytes[1] = static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
            bytes[2] = static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
            bytes[3] = static_cast<char>(0x80 | (cp & 0x3F));
            count = 4;
        }
        // Up to three bytes a unit can overflow the int count of a huge input.
        if (needed > INT_MAX - count) {
            SetLastError(ERROR_INSUFFICIENT_BUFFER);
            return 0;
        }
        if (multiByteCount != 0) {
            if (needed + count > multiByteCount) {
                overflow = true;
                break;
            }
            std::memcpy(multiByteStr + needed, bytes, static_cast<size_t>(count));
        }
        needed += count;
    }
    if (overflow) {
        SetLastError(ERROR_INSUFFICIENT_BUFFER);
        return 0;
    }
    return needed;
}
