// The reading side of CDelimitedString: the scanner, walking by position,
// counting, indexing, finding, inclusion, appending and trimming.
#include <vaskel/framework/exceptions.h>
#include <vaskel/text.h>

#include <climits>
#include <cstdint>
#include <cstring>
#include <functional>
#include <utility>

namespace vaskel {
namespace {

const DWORD notFound = static_cast<DWORD>(-1);
const std::uintptr_t beforeFirst = ~std::uintptr_t(0);

// White space as isspace has it in the "C" locale, whatever locale is set.
bool IsSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

// The length of the text within the given length, stopping at a NUL; an
// all-ones length is bounded by the NUL alone.
DWORD Bounded(const char* text, DWORD length) {
    return text ? static_cast<DWORD>(strnlen(text, length)) : 0;
}

void TrimRange(const char*& first, const char*& last) {
    while (first < last && IsSpace(*first))
        ++first;
    while (last > first && IsSpace(last[-1]))
        --last;
}

POSITION ToPosition(std::uintptr_t offset) {
    return reinterpret_cast<POSITION>(offset);
}

// Compares a listed token with a text of the same length. With case, whole
// tokens are equal exactly when their bytes are: no character decoding needed.
bool SameBytes(const char* token, const char* text, DWORD length) {
    return std::memcmp(token, text, length) == 0;
}

bool SameBytesNoCase(const char* token, const char* text, DWORD length) {
    return _mbsnbicmp(reinterpret_cast<const unsigned char*>(token),
                      reinterpret_cast<const unsigned char*>(text), length) == 0;
}

// The index of the first token of the NUL-terminated list that has the
// text's length and compares equal to it.
template <class Equal>
DWORD IndexOf(const char* list, char delimiter, const char* text, DWORD length, Equal equal) {
    length = Bounded(text, length);
    if (length == 0)
        return notFound;
    const char* token = nullptr;
    DWORD tokenLength = 0;
    DWORD index = 0;
    while (CDelimitedString::GetNextToken(list, token, tokenLength, delimiter)) {
        if (tokenLength == length && equal(token, text, length))
            return index;
        ++index;
    }
    return notFound;
}

// Includes with the other text NUL-terminated at otherLength.
bool IncludesTerminated(const char* text, DWORD textLength, const char* other, DWORD otherLength,
                        char delimiter) {
    // A shorter text may still include a longer one: white space and repeated
    // tokens add to the length only.
    if (text == other && textLength == otherLength)
        return true;
    const char* token = nullptr;
    DWORD length = 0;
    while (CDelimitedString::GetNextToken(other, token, length, delimiter)) {
        if (CDelimitedString::FindTokenPosition(text, textLength, token, length, delimiter, true) ==
            notFound)
            return false;
    }
    return true;
}

CString Lowered(const char* text, DWORD length) {
    CString lowered(text, static_cast<int>(length));
    char* chars = lowered.GetBuffer();
    _mbslwr_s(reinterpret_cast<unsigned char*>(chars), static_cast<size_t>(length) + 1);
    lowered.ReleaseBuffer();
    return lowered;
}

} // namespace

CDelimitedString::CDelimitedString(char delimiter) : m_delimiter(delimiter) {}

CDelimitedString::CDelimitedString(const CString& text, char delimiter)
    : CString(text), m_delimiter(delimiter) {}

CDelimitedString::~CDelimitedString() = default;

CDelimitedString& CDelimitedString::operator=(const CString& text) {
    CString::operator=(text);
    m_delimiter = ',';
    return *this;
}

CDelimitedString& CDelimitedString::operator+=(const CString& token) {
    AddToken(token);
    return *this;
}

bool CDelimitedString::IsBlank(char c, char delimiter) {
    return c != delimiter && IsSpace(c);
}

const char* CDelimitedString::NextDelimiter(const char* from, char delimiter) {
    if (delimiter == '\0')
        return from + std::strlen(from);
    const unsigned char* hit = _mbschr(reinterpret_cast<const unsigned char*>(from),
                                       static_cast<unsigned char>(delimiter));
    return hit ? reinterpret_cast<const char*>(hit) : from + std::strlen(from);
}

DWORD CDelimitedString::ListLength() const {
    return Bounded(GetString(), static_cast<DWORD>(GetLength()));
}

void CDelimitedString::SetText(CString&& text) {
    CString::operator=(std::move(text));
}

bool CDelimitedString::GetNextToken(const char*& cursor, const char*& token, DWORD& length,
                                    char delimiter) {
    if (!cursor)
        return false;
    while (*cursor != '\0') {
        const char* first = cursor;
        const char* last = NextDelimiter(cursor, delimiter);
        cursor = *last == '\0' ? last : last + 1;
        TrimRange(first, last);
        if (first != last) {
            token = first;
            length = static_cast<DWORD>(last - first);
            return true;
        }
    }
    return false;
}

POSITION CDelimitedString::GetFirstTokenPosition() const {
    return IsEmpty() ? nullptr : ToPosition(beforeFirst);
}

bool CDelimitedString::GetNextToken(POSITION& position, const char*& token, DWORD& length) const {
    if (!position)
        return false;
    std::uintptr_t offset = reinterpret_cast<std::uintptr_t>(position);
    if (offset == beforeFirst)
        offset = 0;
    position = nullptr;
    // A position that did not come from this list may point anywhere.
    if (offset >= static_cast<std::uintptr_t>(GetLength()))
        return false;
    const char* text = GetString();
    const char* cursor = text + offset;
    if (!GetNextToken(cursor, token, length, m_delimiter))
        return false;
    if (*cursor != '\0')
        position = ToPosition(static_cast<std::uintptr_t>(cursor - text));
    return true;
}

const char* CDelimitedString::GetNextToken(POSITION& position, DWORD& length) const {
    const char* token = nullptr;
    if (!GetNextToken(position, token, length)) {
        length = 0;
        return nullptr;
    }
    return token;
}

CString CDelimitedString::GetNextToken(POSITION& position) const {
    CString token;
    return GetNextToken(position, token);
}

CString& CDelimitedString::GetNextToken(POSITION& position, CString& token) const {
    const char* start = nullptr;
    DWORD length = 0;
    if (GetNextToken(position, start, length))
        token.SetString(start, static_cast<int>(length));
    return token;
}

DWORD CDelimitedString::GetTokenCount() const {
    const char* cursor = GetString();
    const char* token = nullptr;
    DWORD length = 0;
    DWORD count = 0;
    while (GetNextToken(cursor, token, length, m_delimiter))
        ++count;
    return count;
}

bool CDelimitedString::GetTokenAt(DWORD index, const char*& token, DWORD& length) const {
    const char* cursor = GetString();
    for (DWORD i = 0;; ++i) {
        if (!GetNextToken(cursor, token, length, m_delimiter))
            return false;
        if (i == index)
            return true;
    }
}

CString CDelimitedString::GetTokenAt(DWORD index) const {
    const char* token = nullptr;
    DWORD length = 0;
    return GetTokenAt(index, token, length) ? CString(token, static_cast<int>(length)) : CString();
}

bool CDelimitedString::IsValid() const {
    const char* cursor = GetString();
    if (*cursor == '\0')
        return true;
    const char* token = nullptr;
    DWORD length = 0;
    // Each step starts inside the text; the walk must land on the NUL.
    while (GetNextToken(cursor, token, length, m_delimiter)) {
        if (*cursor == '\0')
            return true;
    }
    return false;
}

DWORD CDelimitedString::FindTokenPosition(const char* text, DWORD textLength, const char* token,
                                          DWORD tokenLength, char delimiter, bool caseSensitive) {
    textLength = Bounded(text, textLength);
    TrimToken(token, tokenLength);
    if (tokenLength == 0)
        return notFound;
    const char* end = text + textLength;
    for (const char* from = text; from < end;) {
        DWORD rest = static_cast<DWORD>(end - from);
        const char* hit = caseSensitive ? VKFindString(from, rest, token, tokenLength)
                                        : VKFindStringNoCase(from, rest, token, tokenLength);
        if (!hit)
            break;
        const char* before = hit;
        while (before > text && IsBlank(before[-1], delimiter))
            --before;
        const char* after = hit + tokenLength;
        while (after < end && IsBlank(*after, delimiter))
            ++after;
        if ((before == text || before[-1] == delimiter) && (after == end || *after == delimiter))
            return static_cast<DWORD>(hit - text);
        // A search text that holds white space or the delimiter may overlap a
        // whole-token occurrence that starts inside this hit.
        from = hit + 1;
    }
    return notFound;
}

DWORD CDelimitedString::FindTokenPosition(const FindTraits& traits, const char* token,
                                          DWORD length) const {
    return FindTokenPosition(GetString(), static_cast<DWORD>(GetLength()), token, length,
                             m_delimiter, traits.caseSensitive);
}

DWORD CDelimitedString::FindToken(const char* token, DWORD length) const {
    return IndexOf(GetString(), m_delimiter, token, length, SameBytes);
}

DWORD CDelimitedString::FindToken(const CString& token) const {
    return FindToken(token.GetString(), static_cast<DWORD>(token.GetLength()));
}

DWORD CDelimitedString::FindTokenNoCase(const char* token, DWORD length) const {
    return IndexOf(GetString(), m_delimiter, token, length, SameBytesNoCase);
}

DWORD CDelimitedString::FindTokenNoCase(const CString& token) const {
    return FindTokenNoCase(token.GetString(), static_cast<DWORD>(token.GetLength()));
}

DWORD CDelimitedString::FindToken(const FindTraits& traits, const char* token, DWORD length) const {
    return traits.caseSensitive ? FindToken(token, length) : FindTokenNoCase(token, length);
}

DWORD CDelimitedString::FindToken(const FindTraits& traits, const CString& token) const {
    return FindToken(traits, token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::HasToken(const char* text, DWORD textLength, const char* token,
                                DWORD tokenLength, char delimiter, bool caseSensitive) {
    return FindTokenPosition(text, textLength, token, tokenLength, delimiter, caseSensitive) !=
           notFound;
}

bool CDelimitedString::HasToken(const char* token, DWORD length) const {
    return HasToken(GetString(), static_cast<DWORD>(GetLength()), token, length, m_delimiter, true);
}

bool CDelimitedString::HasToken(const CString& token) const {
    return HasToken(token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::HasToken(const FindTraits& traits, const char* token, DWORD length) const {
    return FindTokenPosition(traits, token, length) != notFound;
}

bool CDelimitedString::HasToken(const FindTraits& traits, const CString& token) const {
    return HasToken(traits, token.GetString(), static_cast<DWORD>(token.GetLength()));
}

bool CDelimitedString::Includes(const char* text, DWORD textLength, const char* other,
                                DWORD otherLength, char delimiter) {
    textLength = Bounded(text, textLength);
    DWORD bounded = Bounded(other, otherLength);
    if (other && bounded == otherLength) {
        // No NUL inside the given length: the walk needs a terminated copy.
        CString copy(other, static_cast<int>(bounded));
        return IncludesTerminated(text, textLength, copy.GetString(), bounded, delimiter);
    }
    return IncludesTerminated(text, textLength, other, bounded, delimiter);
}

bool CDelimitedString::Includes(const CString& other) const {
    return IncludesTerminated(GetString(), ListLength(), other.GetString(),
                              Bounded(other.GetString(), static_cast<DWORD>(other.GetLength())),
                              m_delimiter);
}

bool CDelimitedString::Includes(const CString& other, const FindTraits& traits) const {
    if (traits.caseSensitive || (traits.selfLowerCase && traits.otherLowerCase))
        return Includes(other);
    const char* text = GetString();
    const char* otherText = other.GetString();
    DWORD length = ListLength();
    DWORD otherLength = Bounded(otherText, static_cast<DWORD>(other.GetLength()));
    if (text == otherText && length == otherLength)
        return true;
    CString lowered;
    CString otherLowered;
    if (!traits.selfLowerCase) {
        lowered = Lowered(text, length);
        text = lowered.GetString();
        length = static_cast<DWORD>(lowered.GetLength());
    }
    if (!traits.otherLowerCase) {
        otherLowered = Lowered(otherText, otherLength);
        otherText = otherLowered.GetString();
        otherLength = static_cast<DWORD>(otherLowered.GetLength());
    }
    return IncludesTerminated(text, length, otherText, otherLength, m_delimiter);
}

bool CDelimitedString::HasDuplicateTokens(const FindTraits& traits) const {
    const char* cursor = GetString();
    const char* end = cursor + ListLength();
    const char* token = nullptr;
    DWORD length = 0;
    // A later occurrence lies behind the delimiter that ends this token.
    while (GetNextToken(cursor, token, length, m_delimiter)) {
        if (FindTokenPosition(cursor, static_cast<DWORD>(end - cursor), token, length, m_delimiter,
                              traits.caseSensitive) != notFound)
            return true;
    }
    return false;
}

void CDelimitedString::AddToken(const char* token, DWORD length) {
    length = Bounded(token, length);
    if (length == 0)
        return;
    if (length > static_cast<DWORD>(INT_MAX))
        AfxThrowMemoryException();
    int count = static_cast<int>(length);
    if (IsEmpty()) {
        SetString(token, count);
        return;
    }
    // Appending the delimiter may move this string's buffer, in which the
    // token may lie.
    const char* text = GetString();
    std::less_equal<const char*> notAfter;
    if (notAfter(text, token) && notAfter(token, text + GetLength())) {
        CString copy(token, count);
        AppendChar(m_delimiter);
        Append(copy);
        return;
    }
    AppendChar(m_delimiter);
    Append(token, count);
}

void CDelimitedString::AddToken(const CString& token) {
    AddToken(token.GetString(), static_cast<DWORD>(token.GetLength()));
}

void CDelimitedString::AddToken(char token) {
    AddToken(&token, 1);
}

bool CDelimitedString::Trimmed() const {
    const char* segment = GetString();
    if (*segment == '\0')
        return true;
    for (bool first = true;; first = false) {
        const char* end = NextDelimiter(segment, m_delimiter);
        bool last = *end == '\0';
        if (segment == end) {
            // An empty segment is allowed between two delimiters only.
            if (first || last)
                return false;
        } else if (IsBlank(*segment, m_delimiter) || IsBlank(end[-1], m_delimiter)) {
            return false;
        }
        if (last)
            return true;
        segment = end + 1;
    }
}

void CDelimitedString::Trim() {
    if (Trimmed())
        return;
    const char* text = GetString();
    int total = GetLength();
    int listed = static_cast<int>(ListLength());
    CString trimmed;
    char* out = trimmed.GetBuffer(total);
    int written = 0;
    for (const char* segment = text;;) {
        const char* end = NextDelimiter(segment, m_delimiter);
        const char* first = segment;
        const char* last = end;
        TrimRange(first, last);
        std::memcpy(out + written, first, static_cast<size_t>(last - first));
        written += static_cast<int>(last - first);
        if (*end == '\0')
            break;
        out[written++] = m_delimiter;
        segment = end + 1;
    }
    // What follows a NUL inside the string is no part of the list; keep it.
    std::memcpy(out + written, text + listed, static_cast<size_t>(total - listed));
    written += total - listed;
    trimmed.ReleaseBuffer(written);
    SetText(std::move(trimmed));
}

void CDelimitedString::TrimToken(const char*& text, DWORD& length) {
    length = Bounded(text, length);
    if (length == 0)
        return;
    const char* last = text + length;
    TrimRange(text, last);
    length = static_cast<DWORD>(last - text);
}

void CDelimitedString::AddStrings(const CStringArray& strings) {
    for (INT_PTR i = 0; i < strings.GetSize(); ++i)
        AddToken(strings[i]);
}

void CDelimitedString::AddStrings(const std::vector<CString>& strings) {
    for (const CString& text : strings)
        AddToken(text);
}

void CDelimitedString::GetStrings(CStringArray& strings) const {
    const char* cursor = GetString();
    const char* token = nullptr;
    DWORD length = 0;
    while (GetNextToken(cursor, token, length, m_delimiter))
        strings.Add(CString(token, static_cast<int>(length)));
}

void CDelimitedString::GetStrings(std::vector<CString>& strings) const {
    strings.reserve(strings.size() + GetTokenCount());
    const char* cursor = GetString();
    const char* token = nullptr;
    DWORD length = 0;
    while (GetNextToken(cursor, token, length, m_delimiter))
        strings.emplace_back(token, static_cast<int>(length));
}

} // namespace vaskel
