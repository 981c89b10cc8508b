#include <vaskel/text.h>

#include <cstring>

namespace vaskel {

CSimpleTokenizer::CSimpleTokenizer(const CString& text)
    : m_text(text), m_position(noPosition), m_tokenStart(noPosition), m_tokenLength(0),
      m_caseSensitive(true) {}

void CSimpleTokenizer::SetString(const CString& text) {
    m_text = text;
    m_position = noPosition;
    m_tokenStart = noPosition;
    m_tokenLength = 0;
}

bool CSimpleTokenizer::MoveFirstToken(const char* delimiter) {
    if (m_text.IsEmpty())
        return false;
    m_position = 0;
    return MoveNextToken(delimiter);
}

bool CSimpleTokenizer::MoveFirstToken(char delimiter) {
    const char text[2] = {delimiter, '\0'};
    return MoveFirstToken(text);
}

bool CSimpleTokenizer::MoveNextToken(const char* delimiter) {
    if (m_position == noPosition)
        return false;
    const char* text = m_text;
    const char* start = text + m_position;
    while (*start && _ismbcspace(static_cast<unsigned char>(*start)))
        ++start;
    if (!*start)
        return false;

    // The text ends at its first NUL for every search.
    const DWORD rest = static_cast<DWORD>(std::strlen(start));
    const DWORD delimiterLength = delimiter ? static_cast<DWORD>(std::strlen(delimiter)) : 0;
    const char* hit = nullptr;
    if (delimiterLength > 0) {
        hit = m_caseSensitive ? reinterpret_cast<const char*>(
                                    _mbsstr(reinterpret_cast<const unsigned char*>(start),
                                            reinterpret_cast<const unsigned char*>(delimiter)))
                              : VKFindStringNoCase(start, rest, delimiter, delimiterLength);
    }
    const char* end = hit ? hit : start + rest;
    m_tokenStart = static_cast<DWORD>(start - text);
    m_tokenLength = static_cast<DWORD>(end - start);
    m_position = static_cast<DWORD>((hit ? hit + delimiterLength : end) - text);
    return m_tokenLength > 0;
}

bool CSimpleTokenizer::MoveNextToken(char delimiter) {
    const char text[2] = {delimiter, '\0'};
    return MoveNextToken(text);
}

bool CSimpleTokenizer::GetFirstToken(const char* delimiter, const char*& token, DWORD& length) {
    return MoveFirstToken(delimiter) && GetCurToken(token, length);
}

bool CSimpleTokenizer::GetFirstToken(char delimiter, const char*& token, DWORD& length) {
    return MoveFirstToken(delimiter) && GetCurToken(token, length);
}

bool CSimpleTokenizer::GetNextToken(const char* delimiter, const char*& token, DWORD& length) {
    return MoveNextToken(delimiter) && GetCurToken(token, length);
}

bool CSimpleTokenizer::GetNextToken(char delimiter, const char*& token, DWORD& length) {
    return MoveNextToken(delimiter) && GetCurToken(token, length);
}

bool CSimpleTokenizer::GetCurToken(const char*& token, DWORD& length) const {
    if (m_tokenLength == 0)
        return false;
    token = GetCurToken(length);
    return true;
}

const char* CSimpleTokenizer::GetCurToken(DWORD& length) const {
    length = m_tokenLength;
    return m_tokenStart == noPosition ? nullptr : static_cast<const char*>(m_text) + m_tokenStart;
}

CString CSimpleTokenizer::GetCurToken() {
    DWORD length = 0;
    const char* token = GetCurToken(length);
    return length ? CString(token, static_cast<int>(length)) : CString();
}

const char* CSimpleTokenizer::GetCurPosition() const {
    return m_position == noPosition ? nullptr : static_cast<const char*>(m_text) + m_position;
}

bool CSimpleTokenizer::eof() const {
    return m_position != noPosition && static_cast<const char*>(m_text)[m_position] == '\0';
}

} // namespace vaskel
