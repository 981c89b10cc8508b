// Multibyte strings in the UTF-8 code page. A character is a well-formed
// UTF-8 sequence; a byte that begins none (a stray continuation byte, a
// truncated or overlong sequence) is a character of its own, so every string
// has one division into characters and a search never stops inside one.
// A character's value, as _mbschr takes it, is its bytes read as one
// big-endian number: 'A' is 0x41, U+00E9 (C3 A9) is 0xC3A9 and U+20AC
// (E2 82 AC) is 0xE282AC, the UTF-8 form of the lead-byte-first values of
// the double-byte code pages.
#include "kernel/utf8.h"

#include <vkwin32/crt.h>

#include <cerrno>
#include <cstring>

namespace {

bool IsLeadByte(unsigned char c) {
    return c >= 0xC2 && c <= 0xF4;
}

// The length of the well-formed character at text, or 1 where none begins.
// Decoding stops at the first byte that cannot continue the character, so a
// NUL ends it before the end of the text is passed.
size_t CharLength(const unsigned char* text) {
    int length = 0;
    char32_t ignored;
    return vkw32::DecodeUtf8(text, 4, length, ignored) ? static_cast<size_t>(length) : 1;
}

unsigned int CharValue(const unsigned char* text, size_t length) {
    unsigned int value = 0;
    for (size_t i = 0; i < length; ++i)
        value = value << 8 | text[i];
    return value;
}

// Whether position begins a character of the string that starts at text.
// Only a lead byte at most three bytes back can reach over it, and a lead
// byte always begins a character, so the bytes before it need no look.
bool IsCharStart(const unsigned char* text, const unsigned char* position) {
    size_t before = static_cast<size_t>(position - text);
    for (size_t back = 1; back <= 3 && back <= before; ++back) {
        const unsigned char* lead = position - back;
        if (IsLeadByte(*lead) && CharLength(lead) > back)
            return false;
    }
    return true;
}

template <class Fold>
int CompareBytes(const unsigned char* a, const unsigned char* b, size_t count, Fold fold) {
    if (a == nullptr || b == nullptr) {
        errno = EINVAL;
        return _NLSCMPERROR;
    }
    // Unsigned bytes in UTF-8 order as the code points do.
    for (size_t i = 0; i < count; ++i) {
        unsigned int x = fold(a[i]), y = fold(b[i]);
        if (x != y)
            return x < y ? -1 : 1;
        if (x == 0)
            break;
    }
    return 0;
}

} // namespace

extern "C" unsigned char* _mbschr(const unsigned char* text, unsigned int c) {
    if (text == nullptr) {
        errno = EINVAL;
        return nullptr;
    }
    // An ASCII byte is never part of a longer character; NUL finds the end.
    if (c < 0x80)
        return reinterpret_cast<unsigned char*>(const_cast<char*>(
            std::strchr(reinterpret_cast<const char*>(text), static_cast<int>(c))));
    for (const unsigned char* p = text; *p != '\0';) {
        size_t length = CharLength(p);
        if (CharValue(p, length) == c)
            return const_cast<unsigned char*>(p);
        p += length;
    }
    return nullptr;
}

extern "C" unsigned char* _mbsstr(const unsigned char* text, const unsigned char* pattern) {
    if (text == nullptr || pattern == nullptr) {
        errno = EINVAL;
        return nullptr;
    }
    const char* bytes = reinterpret_cast<const char*>(text);
    const char* wanted = reinterpret_cast<const char*>(pattern);
    size_t length = std::strlen(wanted);
    // A byte match counts when it begins and ends between characters, which a
    // well-formed pattern always does.
    for (const char* hit = std::strstr(bytes, wanted); hit != nullptr;
         hit = std::strstr(hit + 1, wanted)) {
        const auto* first = reinterpret_cast<const unsigned char*>(hit);
        if (length == 0 || (IsCharStart(text, first) && IsCharStart(text, first + length)))
            return const_cast<unsigned char*>(first);
    }
    return nullptr;
}

extern "C" int _mbsnbcmp(const unsigned char* a, const unsigned char* b, size_t count) {
    return CompareBytes(a, b, count, [](unsigned char c) { return static_cast<unsigned int>(c); });
}

extern "C" int _mbsnbicmp(const unsigned char* a, const unsigned char* b, size_t count) {
    // Every byte of a multibyte character is 0x80 or above, which
    // _mbctolower leaves alone, so folding byte by byte folds characters.
    return CompareBytes(a, b, count, [](unsigned char c) { return _mbctolower(c); });
}

extern "C" errno_t _mbslwr_s(unsigned char* text, size_t sizeInBytes) {
    if (text == nullptr || sizeInBytes == 0) {
        errno = EINVAL;
        return EINVAL;
    }
    size_t length = strnlen(reinterpret_cast<const char*>(text), sizeInBytes);
    if (length == sizeInBytes) {
        // Not terminated within its buffer: leave a string that is.
        text[0] = '\0';
        errno = EINVAL;
        return EINVAL;
    }
    for (size_t i = 0; i < length; ++i)
        text[i] = static_cast<unsigned char>(_mbctolower(text[i]));
    return 0;
}
