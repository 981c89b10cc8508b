#include <vaskel/framework/file_find.h>

namespace vaskel {
namespace {

bool IsSeparator(char c) {
    return c == '\\' || c == '/';
}

// The length of the directory part of a search text: up to and including its
// last separator, else its drive ("C:"). The separators are found as
// multibyte characters, so a trail byte that equals '\' is no separator.
int DirectoryPartLength(const char* name) {
    const unsigned char separators[] = {'\\', '/'};
    int length = 0;
    for (unsigned char separator : separators) {
        const unsigned char* text = reinterpret_cast<const unsigned char*>(name);
        for (const unsigned char* hit = _mbschr(text, separator); hit != nullptr;
             hit = _mbschr(hit + 1, separator)) {
            const int end = static_cast<int>(hit - text) + 1;
            if (end > length)
                length = end;
        }
    }
    if (length == 0 && name[0] != '\0' && name[1] == ':')
        length = 2;
    return length;
}

// The directory without trailing separators, keeping one after nothing or
// after a drive, where it names the root.
CString RootOf(const char* name) {
    CString root(name, DirectoryPartLength(name));
    int length = root.GetLength();
    while (length > 0 && IsSeparator(root[length - 1]))
        --length;
    const bool bareDrive = length == 2 && root[1] == ':';
    if (length < root.GetLength() && (length == 0 || bareDrive))
        ++length;
    return root.Left(length);
}

} // namespace

CFileFind::CFileFind()
    : m_hContext(INVALID_HANDLE_VALUE), m_found(), m_next(), m_hasFound(false), m_hasNext(false) {}

CFileFind::~CFileFind() {
    Close();
}

bool CFileFind::FindFile(const char* name) {
    Close();
    if (name == nullptr)
        name = "*.*";
    HANDLE context = ::FindFirstFileA(name, &m_next);
    if (context == INVALID_HANDLE_VALUE)
        return false;
    m_hContext = context;
    m_hasNext = true;
    m_root = RootOf(name);
    return true;
}

bool CFileFind::FindNextFile() {
    if (!m_hasNext)
        return false;
    m_found = m_next;
    m_hasFound = true;
    // Qualified: on Windows this method itself is named FindNextFileA.
    m_hasNext = ::FindNextFileA(m_hContext, &m_next) != FALSE;
    return m_hasNext;
}

void CFileFind::Close() {
    if (m_hContext != INVALID_HANDLE_VALUE)
        ::FindClose(m_hContext);
    m_hContext = INVALID_HANDLE_VALUE;
    m_hasFound = false;
    m_hasNext = false;
    m_root.Empty();
}

CString CFileFind::GetFileName() const {
    return m_hasFound ? CString(m_found.cFileName) : CString();
}

CString CFileFind::GetFilePath() const {
    if (!m_hasFound)
        return CString();
    CString path = m_root;
    const int length = path.GetLength();
    const bool bareDrive = length == 2 && path[1] == ':';
    if (length > 0 && !IsSeparator(path[length - 1]) && !bareDrive)
        path += '\\';
    path += m_found.cFileName;
    return path;
}

CString CFileFind::GetRoot() const {
    return m_root;
}

ULONGLONG CFileFind::GetLength() const {
    if (!m_hasFound)
        return 0;
    return (static_cast<ULONGLONG>(m_found.nFileSizeHigh) << 32) | m_found.nFileSizeLow;
}

bool CFileFind::GetCreationTime(FILETIME* time) const {
    if (!m_hasFound || time == nullptr)
        return false;
    *time = m_found.ftCreationTime;
    return true;
}

bool CFileFind::GetLastAccessTime(FILETIME* time) const {
    if (!m_hasFound || time == nullptr)
        return false;
    *time = m_found.ftLastAccessTime;
    return true;
}

bool CFileFind::GetLastWriteTime(FILETIME* time) const {
    if (!m_hasFound || time == nullptr)
        return false;
    *time = m_found.ftLastWriteTime;
    return true;
}

DWORD CFileFind::GetAttributes() const {
    return m_hasFound ? m_found.dwFileAttributes : 0;
}

bool CFileFind::MatchesMask(DWORD mask) const {
    return (GetAttributes() & mask) != 0;
}

bool CFileFind::IsDots() const {
    if (!m_hasFound)
        return false;
    const char* name = m_found.cFileName;
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

} // namespace vaskel
