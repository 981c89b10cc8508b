#include <vaskel/text.h>

#include <algorithm>
#include <climits>

namespace vaskel {
namespace {

bool IsBlank(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}
bool IsDigit(char c) {
    return c >= '0' && c <= '9';
}
bool IsAsciiLetter(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}

// The runtime's atoi and atol over at most `length` characters (stopping at a
// NUL): blanks, a sign, digits; saturating at the 32-bit limits.
long long LeadingInteger(const char* text, size_t length) {
    size_t i = 0;
    while (i < length && text[i] != '\0' && IsBlank(text[i]))
        ++i;
    bool negative = false;
    if (i < length && (text[i] == '+' || text[i] == '-'))
        negative = text[i++] == '-';
    long long value = 0;
    const long long limit = negative ? -static_cast<long long>(INT_MIN) : INT_MAX;
    for (; i < length && IsDigit(text[i]); ++i)
        value = std::min(value * 10 + (text[i] - '0'), limit);
    return negative ? -value : value;
}

bool EqualsNoCase(const char* text, const char* word) {
    for (; *text && *word; ++text, ++word) {
        char c = *text >= 'A' && *text <= 'Z' ? static_cast<char>(*text + 32) : *text;
        if (c != *word)
            return false;
    }
    return *text == *word;
}

} // namespace

bool AsBool(const char* text) {
    if (text == nullptr)
        return false;
    VKSkipWhiteSpaces(text);
    if (*text == '\0')
        return false;
    if (!IsAsciiLetter(*text))
        return LeadingInteger(text, static_cast<size_t>(-1)) != 0;
    return EqualsNoCase(text, "true") || EqualsNoCase(text, "yes");
}

int AsInteger(const char* text, DWORD length) {
    if (text == nullptr || length == 0)
        return 0;
    return static_cast<int>(LeadingInteger(text, length));
}

DWORD AsULong(const char* text, DWORD length) {
    if (text == nullptr || length == 0)
        return 0;
    return static_cast<DWORD>(static_cast<LONG>(LeadingInteger(text, length)));
}

} // namespace vaskel
