#include <vaskel/fs.h>

#include <vaskel/framework/file.h>
#include <vaskel/text.h>

namespace vaskel {
namespace {

const char invalidNodeCharacters[] = "\\/:*?\"<>|";

const unsigned char* Bytes(const char* text) {
    return reinterpret_cast<const unsigned char*>(text);
}

// The index of the next backslash at or after start, or -1. Searched as a
// multibyte character, so the trail byte of a double-byte character that
// equals '\' is no separator.
int FindBackslash(const CString& text, int start) {
    const unsigned char* hit = _mbschr(Bytes(text) + start, '\\');
    return hit != nullptr ? static_cast<int>(hit - Bytes(text)) : -1;
}

bool HasInvalidCharacter(const char* node) {
    for (const char* c = invalidNodeCharacters; *c != '\0'; ++c) {
        if (_mbschr(Bytes(node), static_cast<unsigned char>(*c)) != nullptr)
            return true;
    }
    return false;
}

POSITION StartPosition() {
    return reinterpret_cast<POSITION>(static_cast<INT_PTR>(-1));
}

POSITION PositionAt(int index) {
    return reinterpret_cast<POSITION>(static_cast<INT_PTR>(index));
}

} // namespace

const CPathUrl CPathUrl::operator=(const CPathUrl& other) {
    m_url = other.m_url;
    return *this;
}

const CPathUrl CPathUrl::operator=(const CString& url) {
    m_url = url;
    return *this;
}

const CPathUrl CPathUrl::operator=(const char* url) {
    m_url = url;
    return *this;
}

bool CPathUrl::operator==(const CPathUrl& other) const {
    return m_url.CompareNoCase(other.m_url) == 0;
}

bool CPathUrl::operator==(const CString& other) const {
    return m_url.CompareNoCase(other) == 0;
}

bool CPathUrl::operator==(const char* other) const {
    return m_url.CompareNoCase(other) == 0;
}

bool CPathUrl::operator<(const char* other) const {
    return m_url.CompareNoCase(other) < 0;
}

void CPathUrl::Split(CString* drive, CString* directory, CString* name, CString* extension) const {
    VKSplitPath(m_url, drive, directory, name, extension);
}

CString CPathUrl::GetDrive() const {
    return VKGetDrive(m_url);
}

CString CPathUrl::GetDirectory() const {
    return VKGetDirectory(m_url);
}

CString CPathUrl::GetName() const {
    return VKGetFileName(m_url);
}

CString CPathUrl::GetExtension() const {
    return VKGetFileExt(m_url);
}

bool CPathUrl::HasDrive() const {
    return !GetDrive().IsEmpty();
}

CString CPathUrl::GetFileName() const {
    CString name, extension;
    Split(nullptr, nullptr, &name, &extension);
    return VKMakePath(nullptr, nullptr, name, extension);
}

CString CPathUrl::GetFilePath() const {
    CString drive, directory;
    Split(&drive, &directory, nullptr, nullptr);
    return VKMakePath(drive, directory, nullptr, nullptr);
}

CPathUrl CPathUrl::GetParentUrl() const {
    int last = -1;
    for (int hit = FindBackslash(m_url, 0); hit >= 0; hit = FindBackslash(m_url, hit + 1))
        last = hit;
    return last < 0 ? CPathUrl() : CPathUrl(m_url.Left(last));
}

POSITION CPathUrl::GetFirstNodePosition() const {
    return m_url.IsEmpty() ? nullptr : StartPosition();
}

CString& CPathUrl::GetNextNodePosition(POSITION& pos, CString& node) const {
    if (pos == nullptr) {
        node.Empty();
        return node;
    }
    const int length = m_url.GetLength();
    const INT_PTR raw = reinterpret_cast<INT_PTR>(pos);
    const int start = raw < 0 || raw > length ? 0 : static_cast<int>(raw);
    const int backslash = start < length ? FindBackslash(m_url, start) : -1;
    if (backslash < 0) {
        // The rest of the text; after a final backslash that is an empty node.
        node = m_url.Mid(start);
        pos = nullptr;
    } else {
        node = m_url.Mid(start, backslash - start);
        pos = PositionAt(backslash + 1);
    }
    return node;
}

CString CPathUrl::GetNextNodePosition(POSITION& pos) const {
    CString node;
    GetNextNodePosition(pos, node);
    return node;
}

bool CPathUrl::IsValid() const {
    if (m_url.IsEmpty())
        return false;
    // Only the drive's own two characters may hold the colon: the rest of
    // the first node is checked like any other.
    int skip = HasDrive() ? 2 : 0;
    CString node;
    for (POSITION pos = GetFirstNodePosition(); pos != nullptr; skip = 0) {
        GetNextNodePosition(pos, node);
        if (HasInvalidCharacter(node.GetString() +
                                (skip < node.GetLength() ? skip : node.GetLength())))
            return false;
    }
    return true;
}

bool CPathUrl::AddChild(const char* child) {
    m_url = VKMakePath(nullptr, m_url, child, nullptr);
    return IsValid();
}

bool CPathUrl::AddExtension(const char* extension) {
    m_url = VKMakePath(nullptr, nullptr, m_url, extension);
    return IsValid();
}

bool CPathUrl::Exists() const {
    CFileStatus status;
    return CFile::GetStatus(m_url, status);
}

bool CPathUrl::Exists(const CString& base) const {
    CFileStatus status;
    return CFile::GetStatus(VKMakePath(nullptr, base, m_url, nullptr), status);
}

} // namespace vaskel
