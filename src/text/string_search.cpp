#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <algorithm>
#include <cctype>
#include <climits>
#include <cstring>

namespace vaskel {
namespace {

bool EqualBytes(char a, char b) {
    return a == b;
}

bool EqualBytesNoCase(char a, char b) {
    return _mbctolower(static_cast<unsigned char>(a)) == _mbctolower(static_cast<unsigned char>(b));
}

template <class Equal>
const char* BoundedSearch(const char* text, DWORD textLength, const char* pattern,
                          DWORD patternLength, Equal equal) {
    if (!text || !pattern || textLength == 0 || patternLength == 0 || textLength < patternLength)
        return nullptr;
    const char* end = text + textLength;
    const char* hit = std::search(text, end, pattern, pattern + patternLength, equal);
    return hit == end ? nullptr : hit;
}

} // namespace

const char* VKFindString(const char* text, DWORD textLength, const char* pattern,
                         DWORD patternLength) {
    return BoundedSearch(text, textLength, pattern, patternLength, EqualBytes);
}

const char* VKFindStringNoCase(const char* text, DWORD textLength, const char* pattern,
                               DWORD patternLength) {
    return BoundedSearch(text, textLength, pattern, patternLength, EqualBytesNoCase);
}

void VKSkipWhiteSpaces(const char*& text) {
    if (!text)
        return;
    while (*text != '\0' && std::isspace(static_cast<unsigned char>(*text)))
        ++text;
}

void VKCopyStringToBuffer(char* buffer, DWORD bufferSize, const CString& text) {
    if (!buffer || bufferSize == 0)
        return;
    size_t count = std::min(static_cast<size_t>(text.GetLength()), size_t(bufferSize) - 1);
    std::memcpy(buffer, text.GetString(), count);
    buffer[count] = '\0';
}

void VKReserveStringBuffer(CString& text, DWORD length) {
    if (length > static_cast<DWORD>(INT_MAX))
        AfxThrowMemoryException();
    int kept = text.GetLength();
    text.GetBuffer(static_cast<int>(length));
    text.ReleaseBuffer(kept);
}

} // namespace vaskel
