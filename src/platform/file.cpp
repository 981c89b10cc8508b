#include <vaskel/framework/file.h>

#include <algorithm>
#include <cstring>

namespace vaskel {
namespace {

LONGLONG ToUnixSeconds(const FILETIME& time) {
    ULONGLONG ticks = (static_cast<ULONGLONG>(time.dwHighDateTime) << 32) | time.dwLowDateTime;
    const ULONGLONG epochTicks = 116444736000000000ull; // 1 January 1970 in 1601-based ticks
    return ticks >= epochTicks ? static_cast<LONGLONG>((ticks - epochTicks) / 10000000ull)
                               : -static_cast<LONGLONG>((epochTicks - ticks) / 10000000ull);
}

DWORD AccessOf(UINT openFlags) {
    switch (openFlags & 3) {
    case CFile::modeRead:
        return GENERIC_READ;
    case CFile::modeWrite:
        return GENERIC_WRITE;
    case CFile::modeReadWrite:
        return GENERIC_READ | GENERIC_WRITE;
    default:
        return 0;
    }
}

DWORD ShareOf(UINT openFlags) {
    switch (openFlags & 0x70) {
    case CFile::shareDenyWrite:
        return FILE_SHARE_READ;
    case CFile::shareDenyRead:
        return FILE_SHARE_WRITE;
    case CFile::shareDenyNone:
        return FILE_SHARE_READ | FILE_SHARE_WRITE;
    default:
        return 0;
    }
}

DWORD DispositionOf(UINT openFlags) {
    if (openFlags & CFile::modeCreate)
        return (openFlags & CFile::modeNoTruncate) ? OPEN_ALWAYS : CREATE_ALWAYS;
    return OPEN_EXISTING;
}

} // namespace

// The implementation compares with INVALID_HANDLE_VALUE itself, so a file built
// during static initialisation does not depend on this constant.
const HANDLE CFile::hFileNull = INVALID_HANDLE_VALUE;

CFile::CFile() : m_hFile(INVALID_HANDLE_VALUE) {}

CFile::CFile(HANDLE file) : m_hFile(file) {}

CFile::CFile(const char* fileName, UINT openFlags) : m_hFile(INVALID_HANDLE_VALUE) {
    CFileException error;
    if (!Open(fileName, openFlags, &error))
        throw error;
}

CFile::~CFile() {
    if (m_hFile != INVALID_HANDLE_VALUE)
        Abort();
}

bool CFile::Open(const char* fileName, UINT openFlags, CFileException* error) {
    if (m_hFile != INVALID_HANDLE_VALUE)
        Abort();
    if (fileName == nullptr || (openFlags & 3) == 3) {
        if (error)
            *error = CFileException(CFileException::badPath, ERROR_INVALID_PARAMETER, fileName);
        return false;
    }
    DWORD attributes = FILE_ATTRIBUTE_NORMAL;
    if (openFlags & osWriteThrough)
        attributes |= FILE_FLAG_WRITE_THROUGH;
    HANDLE file = CreateFileA(fileName, AccessOf(openFlags), ShareOf(openFlags), nullptr,
                              DispositionOf(openFlags), attributes, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        LONG osError = static_cast<LONG>(GetLastError());
        if (error)
            *error = CFileException(CFileException::OsErrorToException(osError), osError, fileName);
        return false;
    }
    m_hFile = file;
    m_strFileName = fileName;
    return true;
}

void CFile::ThrowLastError() const {
    LONG osError = static_cast<LONG>(GetLastError());
    AfxThrowFileException(CFileException::OsErrorToException(osError), osError, m_strFileName);
}

void CFile::CheckOpen() const {
    if (m_hFile == INVALID_HANDLE_VALUE)
        AfxThrowFileException(CFileException::invalidFile, ERROR_INVALID_HANDLE, m_strFileName);
}

UINT CFile::Read(void* buffer, UINT count) {
    CheckOpen();
    if (count == 0)
        return 0;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    DWORD read = 0;
    if (!ReadFile(m_hFile, buffer, count, &read, nullptr))
        ThrowLastError();
    return read;
}

void CFile::Write(const void* buffer, UINT count) {
    CheckOpen();
    if (count == 0)
        return;
    if (buffer == nullptr)
        AfxThrowInvalidArgException();
    DWORD written = 0;
    if (!WriteFile(m_hFile, buffer, count, &written, nullptr))
        ThrowLastError();
    if (written != count)
        AfxThrowFileException(CFileException::diskFull, -1, m_strFileName);
}

ULONGLONG CFile::Seek(LONGLONG offset, UINT from) {
    CheckOpen();
    if (from > end)
        AfxThrowInvalidArgException();
    LARGE_INTEGER distance;
    distance.QuadPart = offset;
    LARGE_INTEGER position;
    if (!SetFilePointerEx(m_hFile, distance, &position, from))
        ThrowLastError();
    return static_cast<ULONGLONG>(position.QuadPart);
}

ULONGLONG CFile::GetLength() const {
    CheckOpen();
    LARGE_INTEGER size;
    if (!GetFileSizeEx(m_hFile, &size))
        ThrowLastError();
    return static_cast<ULONGLONG>(size.QuadPart);
}

void CFile::SetLength(ULONGLONG newLength) {
    Seek(static_cast<LONGLONG>(newLength), begin);
    if (!SetEndOfFile(m_hFile))
        ThrowLastError();
}

ULONGLONG CFile::GetPosition() const {
    CheckOpen();
    LARGE_INTEGER distance;
    distance.QuadPart = 0;
    LARGE_INTEGER position;
    if (!SetFilePointerEx(m_hFile, distance, &position, FILE_CURRENT))
        ThrowLastError();
    return static_cast<ULONGLONG>(position.QuadPart);
}

void CFile::Flush() {
    if (m_hFile == INVALID_HANDLE_VALUE)
        return;
    if (!FlushFileBuffers(m_hFile))
        ThrowLastError();
}

void CFile::Close() {
    HANDLE file = m_hFile;
    CString name = m_strFileName;
    m_hFile = INVALID_HANDLE_VALUE;
    m_strFileName.Empty();
    if (file != INVALID_HANDLE_VALUE && !CloseHandle(file)) {
        LONG osError = static_cast<LONG>(GetLastError());
        AfxThrowFileException(CFileException::OsErrorToException(osError), osError, name);
    }
}

void CFile::Abort() {
    if (m_hFile != INVALID_HANDLE_VALUE)
        CloseHandle(m_hFile);
    m_hFile = INVALID_HANDLE_VALUE;
    m_strFileName.Empty();
}

CString CFile::GetFileName() const {
    int slash = std::max(m_strFileName.ReverseFind('\\'), m_strFileName.ReverseFind('/'));
    return m_strFileName.Mid(slash + 1);
}

CString CFile::GetFileTitle() const {
    CString name = GetFileName();
    int dot = name.ReverseFind('.');
    return dot > 0 ? name.Left(dot) : name;
}

CString CFile::GetFilePath() const {
    return m_strFileName;
}

void CFile::SetFilePath(const char* newName) {
    m_strFileName = newName;
}

bool CFile::GetStatus(CFileStatus& status) const {
    if (m_hFile == INVALID_HANDLE_VALUE || m_strFileName.IsEmpty())
        return false;
    return GetStatus(m_strFileName, status);
}

bool CFile::GetStatus(const char* fileName, CFileStatus& status) {
    if (fileName == nullptr || std::strlen(fileName) >= MAX_PATH)
        return false;
    WIN32_FILE_ATTRIBUTE_DATA data;
    if (!GetFileAttributesExA(fileName, GetFileExInfoStandard, &data))
        return false;
    status = CFileStatus();
    std::strcpy(status.m_szFullName, fileName);
    status.m_attribute = static_cast<BYTE>(data.dwFileAttributes & 0xFF);
    status.m_size = (static_cast<ULONGLONG>(data.nFileSizeHigh) << 32) | data.nFileSizeLow;
    status.m_ctime = ToUnixSeconds(data.ftCreationTime);
    status.m_atime = ToUnixSeconds(data.ftLastAccessTime);
    status.m_mtime = ToUnixSeconds(data.ftLastWriteTime);
    return true;
}

void CFile::Rename(const char* oldName, const char* newName) {
    if (!MoveFileA(oldName, newName)) {
        LONG osError = static_cast<LONG>(GetLastError());
        AfxThrowFileException(CFileException::OsErrorToException(osError), osError, oldName);
    }
}

void CFile::Remove(const char* fileName) {
    if (!DeleteFileA(fileName)) {
        LONG osError = static_cast<LONG>(GetLastError());
        AfxThrowFileException(CFileException::OsErrorToException(osError), osError, fileName);
    }
}

UINT CFile::GetBufferPtr(UINT command, UINT /*count*/, void** bufferStart, void** bufferMax) {
    if (command != bufferCheck) {
        if (bufferStart)
            *bufferStart = nullptr;
        if (bufferMax)
            *bufferMax = nullptr;
    }
    return 0;
}

} // namespace vaskel
