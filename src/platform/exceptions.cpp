#include <vaskel/framework/exceptions.h>

#include <algorithm>
#include <cstring>

namespace vaskel {
namespace {

const char* const archiveMessages[] = {
    "No archive error occurred.",
    "An unspecified error occurred while accessing the archive.",
    "An attempt was made to write to an archive opened for loading.",
    "An attempt was made to read past the end of the archive.",
    "An attempt was made to read from an archive opened for storing.",
    "An invalid object index was found in the archive.",
    "An unexpected object class was found in the archive.",
    "An unsupported schema or version was found in the archive.",
    "The archive buffer is full.",
};

const char* const fileMessages[] = {
    "No file error occurred.",
    "An unspecified error occurred while accessing the file.",
    "The file could not be found.",
    "The path is invalid.",
    "Too many files are open.",
    "Access to the file was denied.",
    "The file handle is invalid.",
    "The current working directory cannot be removed.",
    "The directory is full.",
    "The file position could not be set.",
    "A hardware input or output error occurred.",
    "A sharing violation occurred while accessing the file.",
    "A locking violation occurred while accessing the file.",
    "The disk is full.",
    "An attempt was made to read past the end of the file.",
};

CString WithFileName(const char* message, const CString& fileName) {
    CString text(message);
    if (!fileName.IsEmpty())
        text.AppendFormat(" (%s)", fileName.GetString());
    return text;
}

template <size_t N>
const char* MessageOf(const char* const (&messages)[N], int cause) {
    return cause >= 0 && static_cast<size_t>(cause) < N ? messages[cause] : messages[1];
}

} // namespace

const char* CException::what() const noexcept {
    return "A framework exception occurred.";
}

bool CException::GetErrorMessage(char* buffer, UINT maxLength, UINT* helpContext) const {
    if (helpContext)
        *helpContext = 0;
    if (!buffer || maxLength == 0)
        return false;
    CString message = GetErrorMessage();
    size_t count = std::min(static_cast<size_t>(message.GetLength()), size_t(maxLength) - 1);
    std::memcpy(buffer, message.GetString(), count);
    buffer[count] = '\0';
    return true;
}

CString CException::GetErrorMessage() const {
    return what();
}

const char* CMemoryException::what() const noexcept {
    return "Out of memory.";
}

const char* CInvalidArgException::what() const noexcept {
    return "Encountered an improper argument.";
}

const char* COleException::what() const noexcept {
    return "An OLE error occurred.";
}

CString COleException::GetErrorMessage() const {
    CString message;
    message.Format("An OLE error 0x%08X occurred.", static_cast<unsigned>(m_sc));
    return message;
}

CArchiveException::CArchiveException(int cause, const char* archiveName)
    : m_cause(cause), m_strFileName(archiveName) {}

const char* CArchiveException::what() const noexcept {
    return MessageOf(archiveMessages, m_cause);
}

CString CArchiveException::GetErrorMessage() const {
    return WithFileName(what(), m_strFileName);
}

CFileException::CFileException(int cause, LONG osError, const char* fileName)
    : m_cause(cause), m_lOsError(osError), m_strFileName(fileName) {}

const char* CFileException::what() const noexcept {
    return MessageOf(fileMessages, m_cause);
}

CString CFileException::GetErrorMessage() const {
    return WithFileName(what(), m_strFileName);
}

int CFileException::OsErrorToException(LONG osError) {
    switch (osError) {
    case NO_ERROR:
        return none;
    case ERROR_FILE_NOT_FOUND:
    case ERROR_NO_MORE_FILES:
        return fileNotFound;
    case ERROR_PATH_NOT_FOUND:
    case ERROR_INVALID_DRIVE:
    case ERROR_NOT_SAME_DEVICE:
    case ERROR_INVALID_NAME:
    case ERROR_BAD_PATHNAME:
    case ERROR_FILENAME_EXCED_RANGE:
    case ERROR_DIRECTORY:
        return badPath;
    case ERROR_TOO_MANY_OPEN_FILES:
        return tooManyOpenFiles;
    case ERROR_ACCESS_DENIED:
    case ERROR_WRITE_PROTECT:
    case ERROR_FILE_EXISTS:
    case ERROR_ALREADY_EXISTS:
    case ERROR_BUSY:
        return accessDenied;
    case ERROR_INVALID_HANDLE:
        return invalidFile;
    case ERROR_CURRENT_DIRECTORY:
    case ERROR_DIR_NOT_EMPTY:
        return removeCurrentDir;
    case ERROR_NEGATIVE_SEEK:
    case ERROR_SEEK_ON_DEVICE:
        return badSeek;
    case ERROR_IO_DEVICE:
        return hardIO;
    case ERROR_SHARING_VIOLATION:
        return sharingViolation;
    case ERROR_LOCK_VIOLATION:
        return lockViolation;
    case ERROR_HANDLE_DISK_FULL:
    case ERROR_DISK_FULL:
        return diskFull;
    case ERROR_HANDLE_EOF:
        return endOfFile;
    default:
        return genericException;
    }
}

void AfxThrowMemoryException() {
    throw CMemoryException();
}

void AfxThrowInvalidArgException() {
    throw CInvalidArgException();
}

void AfxThrowOleException(HRESULT sc) {
    throw COleException(sc);
}

void AfxThrowArchiveException(int cause, const char* archiveName) {
    throw CArchiveException(cause, archiveName);
}

void AfxThrowFileException(int cause, LONG osError, const char* fileName) {
    throw CFileException(cause, osError, fileName);
}

} // namespace vaskel
