// CString: the framework's 8-bit text type. Reference-counted and copied on
// write: copies share one buffer until one of them is changed. Lengths and
// positions are int, as in the framework.
#pragma once

#include <vaskel/export.h>
#include <vaskel/win32.h>

#include <cstdarg>

namespace vaskel {

class VASKEL_API CString {
public:
    CString() noexcept;
    CString(const CString& other);
    CString(CString&& other) noexcept;
    CString(const char* text);
    CString(const char* text, int length);
    CString(const unsigned char* text);
    explicit CString(char ch, int repeat = 1);
    // UTF-16 text, converted to the ANSI code page.
    CString(const WCHAR* text);
    CString(const WCHAR* text, int length);
    ~CString();

    CString& operator=(const CString& other);
    CString& operator=(CString&& other) noexcept;
    CString& operator=(const char* text);
    CString& operator=(const unsigned char* text);
    CString& operator=(char ch);
    CString& operator=(const WCHAR* text);

    CString& operator+=(const CString& text);
    CString& operator+=(const char* text);
    CString& operator+=(char ch);

    int GetLength() const noexcept;
    bool IsEmpty() const noexcept;
    void Empty() noexcept;
    const char* GetString() const noexcept { return m_pszData; }
    operator const char*() const noexcept { return m_pszData; }

    // Out-of-range positions raise the invalid-argument exception.
    char GetAt(int index) const;
    char operator[](int index) const { return GetAt(index); }
    void SetAt(int index, char ch);

    void SetString(const char* text);
    void SetString(const char* text, int length);
    void Append(const CString& text);
    void Append(const char* text);
    void Append(const char* text, int length);
    void AppendChar(char ch);

    // Comparisons of the texts up to their first NUL; results are -1, 0 or 1.
    // NoCase folds ASCII letters to lower case, as the runtime's _stricmp.
    int Compare(const char* text) const;
    int CompareNoCase(const char* text) const;

    CString Left(int count) const;
    CString Mid(int first) const;
    CString Mid(int first, int count) const;
    CString Right(int count) const;
    CString SpanIncluding(const char* charSet) const;
    CString SpanExcluding(const char* charSet) const;
    // The next token at or after start, skipping leading delimiters; start
    // moves behind the token, or becomes -1 when no token is left.
    CString Tokenize(const char* delimiters, int& start) const;

    int Find(char ch, int start = 0) const;
    int Find(const char* text, int start = 0) const;
    int ReverseFind(char ch) const;
    int FindOneOf(const char* charSet) const;

    CString& MakeUpper();
    CString& MakeLower();
    CString& MakeReverse();
    CString& Trim();
    CString& Trim(char target);
    CString& Trim(const char* targets);
    CString& TrimLeft();
    CString& TrimLeft(char target);
    CString& TrimLeft(const char* targets);
    CString& TrimRight();
    CString& TrimRight(char target);
    CString& TrimRight(const char* targets);

    int Replace(char oldChar, char newChar);
    int Replace(const char* oldText, const char* newText);
    int Remove(char ch);
    int Insert(int index, char ch);
    int Insert(int index, const char* text);
    int Delete(int index, int count = 1);

    void Format(const char* format, ...) VASKEL_PRINTF_FORMAT(2, 3);
    void FormatV(const char* format, va_list args);
    void AppendFormat(const char* format, ...) VASKEL_PRINTF_FORMAT(2, 3);
    void AppendFormatV(const char* format, va_list args);

    // Direct access to the characters. Until ReleaseBuffer the buffer belongs
    // to this string alone: copies made meanwhile get their own characters.
    char* GetBuffer();
    char* GetBuffer(int minBufferLength);
    char* GetBufferSetLength(int length);
    // The new length, or up to the first NUL when it is -1.
    void ReleaseBuffer(int newLength = -1);
    void ReleaseBufferSetLength(int newLength);
    void Preallocate(int length);
    void FreeExtra();
    int GetAllocLength() const noexcept;

private:
    // Makes the buffer this string's own with room for capacity characters.
    char* PrepareWrite(int capacity);
    void SetLength(int length) noexcept;
    void AppendOverlapSafe(const char* text, int length);
    void ReplaceRange(int index, int count, const char* text, int length);

    char* m_pszData;
};

VASKEL_API CString operator+(const CString& left, const CString& right);
VASKEL_API CString operator+(const CString& left, const char* right);
VASKEL_API CString operator+(const char* left, const CString& right);
VASKEL_API CString operator+(const CString& left, char right);
VASKEL_API CString operator+(char left, const CString& right);

inline bool operator==(const CString& a, const CString& b) {
    return a.Compare(b) == 0;
}
inline bool operator==(const CString& a, const char* b) {
    return a.Compare(b) == 0;
}
inline bool operator==(const char* a, const CString& b) {
    return b.Compare(a) == 0;
}
inline bool operator!=(const CString& a, const CString& b) {
    return a.Compare(b) != 0;
}
inline bool operator!=(const CString& a, const char* b) {
    return a.Compare(b) != 0;
}
inline bool operator!=(const char* a, const CString& b) {
    return b.Compare(a) != 0;
}
inline bool operator<(const CString& a, const CString& b) {
    return a.Compare(b) < 0;
}
inline bool operator<(const CString& a, const char* b) {
    return a.Compare(b) < 0;
}
inline bool operator<(const char* a, const CString& b) {
    return b.Compare(a) > 0;
}
inline bool operator>(const CString& a, const CString& b) {
    return a.Compare(b) > 0;
}
inline bool operator>(const CString& a, const char* b) {
    return a.Compare(b) > 0;
}
inline bool operator>(const char* a, const CString& b) {
    return b.Compare(a) < 0;
}
inline bool operator<=(const CString& a, const CString& b) {
    return a.Compare(b) <= 0;
}
inline bool operator<=(const CString& a, const char* b) {
    return a.Compare(b) <= 0;
}
inline bool operator<=(const char* a, const CString& b) {
    return b.Compare(a) >= 0;
}
inline bool operator>=(const CString& a, const CString& b) {
    return a.Compare(b) >= 0;
}
inline bool operator>=(const CString& a, const char* b) {
    return a.Compare(b) >= 0;
}
inline bool operator>=(const char* a, const CString& b) {
    return b.Compare(a) <= 0;
}

} // namespace vaskel
