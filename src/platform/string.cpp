#include <vaskel/framework/exceptions.h>
#include <vaskel/framework/string.h>

#include <algorithm>
#include <atomic>
#include <climits>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>

namespace vaskel {

namespace {

// The characters follow this header in one block. A reference count of -1
// marks a buffer handed out by GetBuffer: it is never shared.
struct Header {
    std::atomic<long> refs;
    int length;
    int capacity;
    char* chars() { return reinterpret_cast<char*>(this + 1); }
};

const long lockedRefs = -1;

// The one empty string: never counted and never written, so an empty CString
// allocates nothing. Constant-initialised, so it exists before any static
// constructor runs.
struct EmptyBlock {
    Header header;
    char nul;
};
EmptyBlock emptyBlock = {{{1}, 0, 0}, '\0'};
static_assert(offsetof(EmptyBlock, nul) == sizeof(Header), "characters follow the header");

const char* const whiteSpace = " \t\n\v\f\r";

Header* HeaderOf(const char* chars) {
    return reinterpret_cast<Header*>(const_cast<char*>(chars)) - 1;
}

char* EmptyChars() {
    return emptyBlock.header.chars();
}

bool IsEmptyBlock(const Header* header) {
    return header == &emptyBlock.header;
}

int ToLength(size_t value) {
    if (value > static_cast<size_t>(INT_MAX) - 64)
        AfxThrowMemoryException();
    return static_cast<int>(value);
}

int SafeLength(const char* text) {
    return text ? ToLength(std::strlen(text)) : 0;
}

char LowerAscii(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
}
char UpperAscii(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - ('a' - 'A')) : c;
}

bool InSet(const char* set, char c) {
    return c != '\0' && std::strchr(set, c) != nullptr;
}

// The last byte of the room is always NUL, so a scan for the end of text that
// a caller wrote through GetBuffer stops inside the block.
char* Allocate(int capacity) {
    if (capacity < 0 || capacity > INT_MAX - 64)
        AfxThrowMemoryException();
    void* block = std::malloc(sizeof(Header) + static_cast<size_t>(capacity) + 1);
    if (!block)
        AfxThrowMemoryException();
    Header* header = new (block) Header;
    header->refs.store(1, std::memory_order_relaxed);
    header->length = 0;
    header->capacity = capacity;
    header->chars()[0] = '\0';
    header->chars()[capacity] = '\0';
    return header->chars();
}

char* Duplicate(const char* chars, int length, int capacity) {
    char* copy = Allocate(std::max(capacity, length));
    std::memcpy(copy, chars, static_cast<size_t>(length));
    copy[length] = '\0';
    HeaderOf(copy)->length = length;
    return copy;
}

void Release(char* chars) noexcept {
    Header* header = HeaderOf(chars);
    if (IsEmptyBlock(header))
        return;
    if (header->refs.load(std::memory_order_relaxed) == lockedRefs ||
        header->refs.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        header->~Header();
        std::free(header);
    }
}

char* Share(char* chars) {
    Header* header = HeaderOf(chars);
    if (IsEmptyBlock(header))
        return chars;
    if (header->refs.load(std::memory_order_relaxed) == lockedRefs)
        return Duplicate(chars, header->length, header->length);
    header->refs.fetch_add(1, std::memory_order_relaxed);
    return chars;
}

} // namespace

char* CString::PrepareWrite(int capacity) {
    Header* header = HeaderOf(m_pszData);
    bool shared = IsEmptyBlock(header) || header->refs.load(std::memory_order_acquire) > 1;
    if (!shared && capacity <= header->capacity)
        return m_pszData;
    if (shared) {
        char* copy = Duplicate(m_pszData, header->length, capacity);
        Release(m_pszData);
        m_pszData = copy;
        return m_pszData;
    }
    // Sole owner: move to a larger block, geometrically so that appends stay
    // linear. The whole old room is carried over: a buffer handed out by
    // GetBuffer may hold characters beyond the length.
    if (capacity > INT_MAX - 64)
        AfxThrowMemoryException();
    long long wanted = static_cast<long long>(header->capacity) + header->capacity / 2;
    int grown =
        static_cast<int>(std::max<long long>(capacity, std::min<long long>(wanted, INT_MAX - 64)));
    char* moved = Allocate(grown);
    std::memcpy(moved, m_pszData, static_cast<size_t>(header->capacity) + 1);
    Header* movedHeader = HeaderOf(moved);
    movedHeader->length = header->length;
    movedHeader->refs.store(header->refs.load(std::memory_order_relaxed),
                            std::memory_order_relaxed);
    header->~Header();
    std::free(header);
    m_pszData = moved;
    return m_pszData;
}

void CString::SetLength(int length) noexcept {
    HeaderOf(m_pszData)->length = length;
    m_pszData[length] = '\0';
}

CString::CString() noexcept : m_pszData(EmptyChars()) {}

CString::CString(const CString& other) : m_pszData(Share(other.m_pszData)) {}

CString::CString(CString&& other) noexcept : m_pszData(other.m_pszData) {
    other.m_pszData = EmptyChars();
}

CString::CString(const char* text) : CString() {
    SetString(text);
}

CString::CString(const char* text, int length) : CString() {
    SetString(text, length);
}

CString::CString(const unsigned char* text) : CString(reinterpret_cast<const char*>(text)) {}

CString::CString(char ch, int repeat) : CString() {
    if (repeat > 0) {
        char* chars = PrepareWrite(repeat);
        std::memset(chars, ch, static_cast<size_t>(repeat));
        SetLength(repeat);
    }
}

CString::CString(const WCHAR* text) : CString() {
    if (text) {
        int length = 0;
        while (text[length] != 0)
            ++length;
        *this = CString(text, length);
    }
}

CString::CString(const WCHAR* text, int length) : CString() {
    if (!text || length <= 0)
        return;
    int bytes = WideCharToMultiByte(CP_ACP, 0, text, length, nullptr, 0, nullptr, nullptr);
    if (bytes <= 0)
        AfxThrowMemoryException(); // only a text too long for a CString fails here
    char* chars = PrepareWrite(bytes);
    WideCharToMultiByte(CP_ACP, 0, text, length, chars, bytes, nullptr, nullptr);
    SetLength(bytes);
}

CString::~CString() {
    Release(m_pszData);
}

CString& CString::operator=(const CString& other) {
    if (m_pszData != other.m_pszData) {
        char* shared = Share(other.m_pszData);
        Release(m_pszData);
        m_pszData = shared;
    }
    return *this;
}

CString& CString::operator=(CString&& other) noexcept {
    if (this != &other) {
        Release(m_pszData);
        m_pszData = other.m_pszData;
        other.m_pszData = EmptyChars();
    }
    return *this;
}

CString& CString::operator=(const char* text) {
    SetString(text);
    return *this;
}

CString& CString::operator=(const unsigned char* text) {
    SetString(reinterpret_cast<const char*>(text));
    return *this;
}

CString& CString::operator=(char ch) {
    // As a one-character C string: NUL gives the empty string.
    char text[2] = {ch, '\0'};
    SetString(text);
    return *this;
}

CString& CString::operator=(const WCHAR* text) {
    return *this = CString(text);
}

CString& CString::operator+=(const CString& text) {
    Append(text);
    return *this;
}

CString& CString::operator+=(const char* text) {
    Append(text);
    return *this;
}

CString& CString::operator+=(char ch) {
    AppendChar(ch);
    return *this;
}

int CString::GetLength() const noexcept {
    return HeaderOf(m_pszData)->length;
}

bool CString::IsEmpty() const noexcept {
    return HeaderOf(m_pszData)->length == 0;
}

void CString::Empty() noexcept {
    Release(m_pszData);
    m_pszData = EmptyChars();
}

char CString::GetAt(int index) const {
    if (index < 0 || index >= GetLength())
        AfxThrowInvalidArgException();
    return m_pszData[index];
}

void CString::SetAt(int index, char ch) {
    if (index < 0 || index >= GetLength())
        AfxThrowInvalidArgException();
    PrepareWrite(GetLength())[index] = ch;
}

void CString::SetString(const char* text) {
    SetString(text, SafeLength(text));
}

void CString::SetString(const char* text, int length) {
    if (!text || length <= 0) {
        Empty();
        return;
    }
    // The text may lie inside this string's own buffer.
    CString copy;
    char* chars = copy.PrepareWrite(length);
    std::memcpy(chars, text, static_cast<size_t>(length));
    copy.SetLength(length);
    *this = std::move(copy);
}

void CString::AppendOverlapSafe(const char* text, int length) {
    if (!text || length <= 0)
        return;
    int old = GetLength();
    if (length > INT_MAX - 64 - old)
        AfxThrowMemoryException();
    const char* begin = m_pszData;
    std::less_equal<const char*> notAfter;
    bool inside = notAfter(begin, text) && notAfter(text, begin + old);
    ptrdiff_t offset = inside ? text - begin : 0;
    char* chars = PrepareWrite(old + length);
    if (inside)
        text = chars + offset;
    std::memmove(chars + old, text, static_cast<size_t>(length));
    SetLength(old + length);
}

void CString::Append(const CString& text) {
    if (IsEmpty()) {
        *this = text;
        return;
    }
    AppendOverlapSafe(text.m_pszData, text.GetLength());
}

void CString::Append(const char* text) {
    AppendOverlapSafe(text, SafeLength(text));
}

void CString::Append(const char* text, int length) {
    if (!text || length <= 0)
        return;
    // Stop at a NUL inside the given length, as the framework does.
    const void* nul = std::memchr(text, '\0', static_cast<size_t>(length));
    if (nul)
        length = static_cast<int>(static_cast<const char*>(nul) - text);
    AppendOverlapSafe(text, length);
}

void CString::AppendChar(char ch) {
    int old = GetLength();
    char* chars = PrepareWrite(old + 1);
    chars[old] = ch;
    SetLength(old + 1);
}

int CString::Compare(const char* text) const {
    int result = std::strcmp(m_pszData, text ? text : "");
    return result < 0 ? -1 : (result > 0 ? 1 : 0);
}

int CString::CompareNoCase(const char* text) const {
    const unsigned char* a = reinterpret_cast<const unsigned char*>(m_pszData);
    const unsigned char* b = reinterpret_cast<const unsigned char*>(text ? text : "");
    for (;; ++a, ++b) {
        unsigned char ca = static_cast<unsigned char>(LowerAscii(static_cast<char>(*a)));
        unsigned char cb = static_cast<unsigned char>(LowerAscii(static_cast<char>(*b)));
        if (ca != cb)
            return ca < cb ? -1 : 1;
        if (ca == 0)
            return 0;
    }
}

CString CString::Left(int count) const {
    count = std::max(0, std::min(count, GetLength()));
    return count == GetLength() ? *this : CString(m_pszData, count);
}

CString CString::Mid(int first) const {
    return Mid(first, INT_MAX);
}

CString CString::Mid(int first, int count) const {
    int length = GetLength();
    first = std::max(first, 0);
    count = std::max(count, 0);
    if (first >= length)
        return CString();
    count = std::min(count, length - first);
    if (first == 0 && count == length)
        return *this;
    return CString(m_pszData + first, count);
}

CString CString::Right(int count) const {
    int length = GetLength();
    count = std::max(0, std::min(count, length));
    return count == length ? *this : CString(m_pszData + length - count, count);
}

CString CString::SpanIncluding(const char* charSet) const {
    return Left(static_cast<int>(std::strspn(m_pszData, charSet ? charSet : "")));
}

CString CString::SpanExcluding(const char* charSet) const {
    return Left(static_cast<int>(std::strcspn(m_pszData, charSet ? charSet : "")));
}

CString CString::Tokenize(const char* delimiters, int& start) const {
    int length = GetLength();
    if (start < 0 || start >= length) {
        start = -1;
        return CString();
    }
    if (!delimiters || *delimiters == '\0') {
        CString rest = Mid(start);
        start = length;
        return rest;
    }
    const char* p = m_pszData + start;
    p += std::strspn(p, delimiters);
    if (p >= m_pszData + length) {
        start = -1;
        return CString();
    }
    size_t tokenLength = std::strcspn(p, delimiters);
    int tokenStart = static_cast<int>(p - m_pszData);
    start = tokenStart + static_cast<int>(tokenLength) + 1;
    return CString(p, static_cast<int>(tokenLength));
}

int CString::Find(char ch, int start) const {
    int length = GetLength();
    if (start < 0 || start >= length)
        return -1;
    const void* hit = std::memchr(m_pszData + start, ch, static_cast<size_t>(length - start));
    return hit ? static_cast<int>(static_cast<const char*>(hit) - m_pszData) : -1;
}

int CString::Find(const char* text, int start) const {
    int length = GetLength();
    if (!text || start < 0 || start > length)
        return -1;
    const char* hit = std::strstr(m_pszData + start, text);
    return hit ? static_cast<int>(hit - m_pszData) : -1;
}

int CString::ReverseFind(char ch) const {
    for (int i = GetLength() - 1; i >= 0; --i)
        if (m_pszData[i] == ch)
            return i;
    return -1;
}

int CString::FindOneOf(const char* charSet) const {
    if (!charSet || *charSet == '\0')
        return -1;
    // The scan stops at the first NUL, which may be an embedded one: it is
    // not one of the characters looked for.
    size_t index = std::strcspn(m_pszData, charSet);
    return m_pszData[index] != '\0' ? static_cast<int>(index) : -1;
}

CString& CString::MakeUpper() {
    int length = GetLength();
    if (length > 0) {
        char* chars = PrepareWrite(length);
        for (int i = 0; i < length; ++i)
            chars[i] = UpperAscii(chars[i]);
    }
    return *this;
}

CString& CString::MakeLower() {
    int length = GetLength();
    if (length > 0) {
        char* chars = PrepareWrite(length);
        for (int i = 0; i < length; ++i)
            chars[i] = LowerAscii(chars[i]);
    }
    return *this;
}

CString& CString::MakeReverse() {
    int length = GetLength();
    if (length > 1) {
        char* chars = PrepareWrite(length);
        std::reverse(chars, chars + length);
    }
    return *this;
}

CString& CString::Trim() {
    return TrimRight().TrimLeft();
}
CString& CString::Trim(char target) {
    return TrimRight(target).TrimLeft(target);
}
CString& CString::Trim(const char* targets) {
    return TrimRight(targets).TrimLeft(targets);
}

CString& CString::TrimLeft() {
    return TrimLeft(whiteSpace);
}

CString& CString::TrimLeft(char target) {
    char set[2] = {target, '\0'};
    return TrimLeft(set);
}

CString& CString::TrimLeft(const char* targets) {
    if (!targets)
        return *this;
    int length = GetLength();
    int skip = 0;
    while (skip < length && InSet(targets, m_pszData[skip]))
        ++skip;
    if (skip > 0)
        ReplaceRange(0, skip, nullptr, 0);
    return *this;
}

CString& CString::TrimRight() {
    return TrimRight(whiteSpace);
}

CString& CString::TrimRight(char target) {
    char set[2] = {target, '\0'};
    return TrimRight(set);
}

CString& CString::TrimRight(const char* targets) {
    if (!targets)
        return *this;
    int length = GetLength();
    int end = length;
    while (end > 0 && InSet(targets, m_pszData[end - 1]))
        --end;
    if (end < length) {
        PrepareWrite(length);
        SetLength(end);
    }
    return *this;
}

void CString::ReplaceRange(int index, int count, const char* text, int length) {
    // Builds the result separately: the inserted text may lie inside this string.
    int old = GetLength();
    int result = ToLength(static_cast<size_t>(old - count) + static_cast<size_t>(length));
    CString rebuilt;
    char* chars = rebuilt.PrepareWrite(result);
    std::memcpy(chars, m_pszData, static_cast<size_t>(index));
    if (length > 0)
        std::memcpy(chars + index, text, static_cast<size_t>(length));
    std::memcpy(chars + index + length, m_pszData + index + count,
                static_cast<size_t>(old - index - count));
    rebuilt.SetLength(result);
    *this = std::move(rebuilt);
}

int CString::Replace(char oldChar, char newChar) {
    if (oldChar == newChar)
        return 0;
    int length = GetLength();
    int count = 0;
    for (int i = 0; i < length; ++i) {
        if (m_pszData[i] == oldChar) {
            if (count++ == 0)
                PrepareWrite(length);
            m_pszData[i] = newChar;
        }
    }
    return count;
}

int CString::Replace(const char* oldText, const char* newText) {
    int oldLength = SafeLength(oldText);
    if (oldLength == 0)
        return 0;
    int newLength = SafeLength(newText);
    int length = GetLength();
    int count = 0;
    for (const char* p = std::strstr(m_pszData, oldText); p && p < m_pszData + length;
         p = std::strstr(p + oldLength, oldText))
        ++count;
    if (count == 0)
        return 0;
    size_t resultLength = static_cast<size_t>(length) +
                          static_cast<size_t>(count) * static_cast<size_t>(newLength) -
                          static_cast<size_t>(count) * static_cast<size_t>(oldLength);
    CString result;
    char* out = result.PrepareWrite(ToLength(resultLength));
    const char* in = m_pszData;
    for (const char* p = std::strstr(in, oldText); p && p < m_pszData + length;
         p = std::strstr(in, oldText)) {
        size_t keep = static_cast<size_t>(p - in);
        std::memcpy(out, in, keep);
        out += keep;
        if (newLength > 0) // newText may be null: the match is removed
            std::memcpy(out, newText, static_cast<size_t>(newLength));
        out += newLength;
        in = p + oldLength;
    }
    std::memcpy(out, in, static_cast<size_t>(m_pszData + length - in));
    result.SetLength(static_cast<int>(resultLength));
    *this = std::move(result);
    return count;
}

int CString::Remove(char ch) {
    int length = GetLength();
    if (Find(ch) < 0)
        return 0;
    char* chars = PrepareWrite(length);
    char* end = std::remove(chars, chars + length, ch);
    int kept = static_cast<int>(end - chars);
    SetLength(kept);
    return length - kept;
}

int CString::Insert(int index, char ch) {
    return Insert(index, CString(ch, 1));
}

int CString::Insert(int index, const char* text) {
    int length = GetLength();
    index = std::max(0, std::min(index, length));
    int insertLength = SafeLength(text);
    if (insertLength > 0)
        ReplaceRange(index, 0, text, insertLength);
    return GetLength();
}

int CString::Delete(int index, int count) {
    int length = GetLength();
    index = std::max(index, 0);
    if (count > 0 && index < length) {
        count = std::min(count, length - index);
        ReplaceRange(index, count, nullptr, 0);
    }
    return GetLength();
}

void CString::Format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    FormatV(format, args);
    va_end(args);
}

void CString::FormatV(const char* format, va_list args) {
    CString result;
    result.AppendFormatV(format, args);
    *this = std::move(result);
}

void CString::AppendFormat(const char* format, ...) {
    va_list args;
    va_start(args, format);
    AppendFormatV(format, args);
    va_end(args);
}

void CString::AppendFormatV(const char* format, va_list args) {
    if (!format)
        AfxThrowInvalidArgException();
    // Most texts fit a small buffer and need a single pass; a longer one is
    // measured by that pass and formatted again into its own room.
    char small[256];
    va_list measure;
    va_copy(measure, args);
    int needed = std::vsnprintf(small, sizeof small, format, measure);
    va_end(measure);
    if (needed < 0)
        AfxThrowInvalidArgException();
    if (needed < static_cast<int>(sizeof small)) {
        AppendOverlapSafe(small, needed);
        return;
    }
    // The arguments may point into this string's own buffer, so the text is
    // formatted into a new buffer and then appended.
    CString formatted;
    char* chars = formatted.PrepareWrite(needed);
    std::vsnprintf(chars, static_cast<size_t>(needed) + 1, format, args);
    formatted.SetLength(needed);
    Append(formatted);
}

char* CString::GetBuffer() {
    return GetBuffer(0);
}

char* CString::GetBuffer(int minBufferLength) {
    if (minBufferLength < 0)
        AfxThrowInvalidArgException();
    int length = GetLength();
    // Even an empty request gets a buffer of its own that may be written.
    char* chars = PrepareWrite(std::max({minBufferLength, length, 1}));
    HeaderOf(m_pszData)->refs.store(lockedRefs, std::memory_order_relaxed);
    return chars;
}

char* CString::GetBufferSetLength(int length) {
    char* chars = GetBuffer(length);
    SetLength(length);
    return chars;
}

void CString::ReleaseBuffer(int newLength) {
    Header* data = HeaderOf(m_pszData);
    if (IsEmptyBlock(data))
        return;
    if (newLength < 0) {
        const void* nul = std::memchr(m_pszData, '\0', static_cast<size_t>(data->capacity) + 1);
        newLength =
            nul ? static_cast<int>(static_cast<const char*>(nul) - m_pszData) : data->capacity;
    }
    newLength = std::min(newLength, data->capacity);
    SetLength(newLength);
    if (data->refs.load(std::memory_order_relaxed) == lockedRefs)
        data->refs.store(1, std::memory_order_relaxed);
}

void CString::ReleaseBufferSetLength(int newLength) {
    if (newLength < 0)
        AfxThrowInvalidArgException();
    ReleaseBuffer(newLength);
}

void CString::Preallocate(int length) {
    if (length < 0)
        AfxThrowInvalidArgException();
    if (length > HeaderOf(m_pszData)->capacity)
        PrepareWrite(length);
}

void CString::FreeExtra() {
    Header* data = HeaderOf(m_pszData);
    if (IsEmptyBlock(data) || data->capacity == data->length)
        return;
    if (data->refs.load(std::memory_order_acquire) != 1)
        return; // shared or handed out: another owner may rely on the room
    if (data->length == 0) {
        Empty();
        return;
    }
    CString compact(m_pszData, data->length);
    *this = std::move(compact);
}

int CString::GetAllocLength() const noexcept {
    return HeaderOf(m_pszData)->capacity;
}

CString operator+(const CString& left, const CString& right) {
    CString result(left);
    result.Append(right);
    return result;
}

CString operator+(const CString& left, const char* right) {
    CString result(left);
    result.Append(right);
    return result;
}

CString operator+(const char* left, const CString& right) {
    CString result(left);
    result.Append(right);
    return result;
}

CString operator+(const CString& left, char right) {
    CString result(left);
    result.AppendChar(right);
    return result;
}

CString operator+(char left, const CString& right) {
    CString result(left, 1);
    result.Append(right);
    return result;
}

} // namespace vaskel
