// Files through the Win32 file API on POSIX descriptors. Share modes have no
// POSIX counterpart and are accepted without effect.
#include "file_status.h"
#include "handle_table.h"
#include "posix_path.h"

#include <vkwin32/kernel.h>

#include <cerrno>
#include <climits>
#include <cstdio>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace vkw32 {
namespace {

class FileObject : public KernelObject {
public:
    explicit FileObject(int descriptor) : fd(descriptor) {}
    ~FileObject() override { ::close(fd); }
    const int fd;
};

int OpenFlags(DWORD access) {
    bool read = (access & (GENERIC_READ | GENERIC_ALL)) != 0;
    bool write = (access & (GENERIC_WRITE | GENERIC_ALL)) != 0;
    if (read && write)
        return O_RDWR;
    return write ? O_WRONLY : O_RDONLY;
}

int OpenWithRetry(const std::string& path, int flags, mode_t mode) {
    int fd;
    do {
        fd = ::open(path.c_str(), flags | O_CLOEXEC, mode);
    } while (fd < 0 && errno == EINTR);
    return fd;
}

} // namespace
} // namespace vkw32

using vkw32::FileObject;

extern "C" HANDLE WINAPI CreateFileA(LPCSTR fileName, DWORD desiredAccess, DWORD /*shareMode*/,
                                     LPSECURITY_ATTRIBUTES /*securityAttributes*/,
                                     DWORD creationDisposition, DWORD flagsAndAttributes,
                                     HANDLE /*templateFile*/) {
    std::string path;
    if (!vkw32::ToPosixPath(fileName, path))
        return INVALID_HANDLE_VALUE;
    int flags = vkw32::OpenFlags(desiredAccess);
    bool writable = flags != O_RDONLY;
    mode_t mode = (flagsAndAttributes & FILE_ATTRIBUTE_READONLY) ? 0444 : 0666;

    // An existing file is truncated only after the checks below, so that a
    // refused open leaves it intact.
    int fd = -1;
    bool created = false;
    switch (creationDisposition) {
    case CREATE_NEW:
        fd = vkw32::OpenWithRetry(path, flags | O_CREAT | O_EXCL, mode);
        created = fd >= 0;
        break;
    case CREATE_ALWAYS:
    case OPEN_ALWAYS:
        fd = vkw32::OpenWithRetry(path, flags | O_CREAT | O_EXCL, mode);
        created = fd >= 0;
        if (fd < 0 && errno == EEXIST)
            fd = vkw32::OpenWithRetry(path, flags, mode);
        break;
    case OPEN_EXISTING:
        fd = vkw32::OpenWithRetry(path, flags, mode);
        break;
    case TRUNCATE_EXISTING:
        if (!writable) {
            SetLastError(ERROR_INVALID_PARAMETER);
            return INVALID_HANDLE_VALUE;
        }
        fd = vkw32::OpenWithRetry(path, flags, mode);
        break;
    default:
        SetLastError(ERROR_INVALID_PARAMETER);
        return INVALID_HANDLE_VALUE;
    }
    if (fd < 0) {
        vkw32::SetPathError(errno, path);
        return INVALID_HANDLE_VALUE;
    }
    struct stat st;
    if (::fstat(fd, &st) != 0 ||
        (S_ISDIR(st.st_mode) && !(flagsAndAttributes & FILE_FLAG_BACKUP_SEMANTICS)) ||
        (writable && !created && vkw32::IsReadOnly(st))) {
        ::close(fd);
        SetLastError(ERROR_ACCESS_DENIED);
        return INVALID_HANDLE_VALUE;
    }
    bool truncate =
        writable && !created && S_ISREG(st.st_mode) &&
        (creationDisposition == CREATE_ALWAYS || creationDisposition == TRUNCATE_EXISTING);
    if (truncate && ::ftruncate(fd, 0) != 0) {
        int error = errno;
        ::close(fd);
        vkw32::SetLastErrorFromErrno(error);
        return INVALID_HANDLE_VALUE;
    }
    HANDLE handle = vkw32::InsertHandle(std::make_shared<FileObject>(fd));
    bool existed =
        !created && (creationDisposition == CREATE_ALWAYS || creationDisposition == OPEN_ALWAYS);
    SetLastError(existed ? ERROR_ALREADY_EXISTS : ERROR_SUCCESS);
    return handle;
}

extern "C" BOOL WINAPI ReadFile(HANDLE file, LPVOID buffer, DWORD numberOfBytesToRead,
                                LPDWORD numberOfBytesRead, LPOVERLAPPED /*overlapped*/) {
    if (numberOfBytesRead)
        *numberOfBytesRead = 0;
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    if (buffer == nullptr && numberOfBytesToRead != 0) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    // A file read returns fewer bytes than asked only at the end of the file.
    DWORD total = 0;
    while (total < numberOfBytesToRead) {
        ssize_t got =
            ::read(object->fd, static_cast<char*>(buffer) + total, numberOfBytesToRead - total);
        if (got < 0 && errno == EINTR)
            continue;
        if (got < 0) {
            SetLastError(errno == EBADF ? ERROR_ACCESS_DENIED : vkw32::ErrorFromErrno(errno));
            if (numberOfBytesRead)
                *numberOfBytesRead = total;
            return FALSE;
        }
        if (got == 0)
            break;
        total += static_cast<DWORD>(got);
    }
    if (numberOfBytesRead)
        *numberOfBytesRead = total;
    return TRUE;
}

extern "C" BOOL WINAPI WriteFile(HANDLE file, LPCVOID buffer, DWORD numberOfBytesToWrite,
                                 LPDWORD numberOfBytesWritten, LPOVERLAPPED /*overlapped*/) {
    if (numberOfBytesWritten)
        *numberOfBytesWritten = 0;
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    if (buffer == nullptr && numberOfBytesToWrite != 0) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    DWORD total = 0;
    while (total < numberOfBytesToWrite) {
        ssize_t put = ::write(object->fd, static_cast<const char*>(buffer) + total,
                              numberOfBytesToWrite - total);
        if (put < 0 && errno == EINTR)
            continue;
        if (put < 0) {
            SetLastError(errno == EBADF ? ERROR_ACCESS_DENIED : vkw32::ErrorFromErrno(errno));
            if (numberOfBytesWritten)
                *numberOfBytesWritten = total;
            return FALSE;
        }
        total += static_cast<DWORD>(put);
    }
    if (numberOfBytesWritten)
        *numberOfBytesWritten = total;
    return TRUE;
}

extern "C" BOOL WINAPI SetFilePointerEx(HANDLE file, LARGE_INTEGER distanceToMove,
                                        PLARGE_INTEGER newFilePointer, DWORD moveMethod) {
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    off_t base;
    switch (moveMethod) {
    case FILE_BEGIN:
        base = 0;
        break;
    case FILE_CURRENT:
        base = ::lseek(object->fd, 0, SEEK_CUR);
        break;
    case FILE_END: {
        struct stat st;
        base = ::fstat(object->fd, &st) == 0 ? st.st_size : -1;
        break;
    }
    default:
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    if (base < 0) {
        vkw32::SetLastErrorFromErrno(errno);
        return FALSE;
    }
    LONGLONG distance = distanceToMove.QuadPart;
    if ((distance < 0 && base + distance < 0)) {
        SetLastError(ERROR_NEGATIVE_SEEK);
        return FALSE;
    }
    if (distance > 0 && base > LLONG_MAX - distance) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    off_t position = ::lseek(object->fd, base + distance, SEEK_SET);
    if (position < 0) {
        vkw32::SetLastErrorFromErrno(errno);
        return FALSE;
    }
    if (newFilePointer)
        newFilePointer->QuadPart = position;
    return TRUE;
}

extern "C" BOOL WINAPI GetFileSizeEx(HANDLE file, PLARGE_INTEGER fileSize) {
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    struct stat st;
    if (::fstat(object->fd, &st) != 0) {
        vkw32::SetLastErrorFromErrno(errno);
        return FALSE;
    }
    if (fileSize)
        fileSize->QuadPart = st.st_size;
    return TRUE;
}

extern "C" BOOL WINAPI SetEndOfFile(HANDLE file) {
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    off_t position = ::lseek(object->fd, 0, SEEK_CUR);
    if (position < 0 || ::ftruncate(object->fd, position) != 0) {
        SetLastError(errno == EBADF || errno == EINVAL ? ERROR_ACCESS_DENIED
                                                       : vkw32::ErrorFromErrno(errno));
        return FALSE;
    }
    return TRUE;
}

extern "C" BOOL WINAPI FlushFileBuffers(HANDLE file) {
    auto object = vkw32::LookupHandleAs<FileObject>(file);
    if (!object)
        return FALSE;
    // Windows flushes only through a handle with write access.
    if ((::fcntl(object->fd, F_GETFL) & O_ACCMODE) == O_RDONLY) {
        SetLastError(ERROR_ACCESS_DENIED);
        return FALSE;
    }
    if (::fsync(object->fd) != 0 && errno != EINVAL) {
        vkw32::SetLastErrorFromErrno(errno);
        return FALSE;
    }
    return TRUE;
}

extern "C" BOOL WINAPI GetFileAttributesExA(LPCSTR fileName, GET_FILEEX_INFO_LEVELS infoLevelId,
                                            LPVOID fileInformation) {
    if (infoLevelId != GetFileExInfoStandard || fileInformation == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    std::string path;
    if (!vkw32::ToPosixPath(fileName, path))
        return FALSE;
    struct stat st;
    if (::stat(path.c_str(), &st) != 0) {
        vkw32::SetPathError(errno, path);
        return FALSE;
    }
    auto* data = static_cast<WIN32_FILE_ATTRIBUTE_DATA*>(fileInformation);
    data->dwFileAttributes = vkw32::AttributesOf(st);
    // POSIX keeps no creation time; the status-change time is the nearest.
    data->ftCreationTime = vkw32::ToFileTime(st.st_ctim);
    data->ftLastAccessTime = vkw32::ToFileTime(st.st_atim);
    data->ftLastWriteTime = vkw32::ToFileTime(st.st_mtim);
    ULONGLONG size = S_ISDIR(st.st_mode) ? 0 : static_cast<ULONGLONG>(st.st_size);
    data->nFileSizeHigh = static_cast<DWORD>(size >> 32);
    data->nFileSizeLow = static_cast<DWORD>(size);
    return TRUE;
}

extern "C" DWORD WINAPI GetFileAttributesA(LPCSTR fileName) {
    WIN32_FILE_ATTRIBUTE_DATA data;
    if (!GetFileAttributesExA(fileName, GetFileExInfoStandard, &data))
        return INVALID_FILE_ATTRIBUTES;
    return data.dwFileAttributes;
}

extern "C" BOOL WINAPI DeleteFileA(LPCSTR fileName) {
    std::string path;
    if (!vkw32::ToPosixPath(fileName, path))
        return FALSE;
    struct stat st;
    if (::lstat(path.c_str(), &st) == 0 && (S_ISDIR(st.st_mode) || vkw32::IsReadOnly(st))) {
        SetLastError(ERROR_ACCESS_DENIED);
        return FALSE;
    }
    if (::unlink(path.c_str()) != 0) {
        vkw32::SetPathError(errno, path);
        return FALSE;
    }
    return TRUE;
}

extern "C" BOOL WINAPI MoveFileA(LPCSTR existingFileName, LPCSTR newFileName) {
    std::string from, to;
    if (!vkw32::ToPosixPath(existingFileName, from) || !vkw32::ToPosixPath(newFileName, to))
        return FALSE;
    // MoveFile never replaces an existing target. A file system without
    // RENAME_NOREPLACE gets a check before the rename.
    int result = ::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE);
    if (result != 0 && errno == EINVAL) {
        struct stat st;
        if (::lstat(to.c_str(), &st) == 0)
            errno = EEXIST;
        else
            result = ::rename(from.c_str(), to.c_str());
    }
    if (result != 0) {
        int error = errno;
        if (error == EEXIST) {
            SetLastError(ERROR_ALREADY_EXISTS);
            return FALSE;
        }
        // With the source present, a missing path is the target's directory.
        struct stat st;
        bool sourceExists = error == ENOENT && ::lstat(from.c_str(), &st) == 0;
        vkw32::SetPathError(error, sourceExists ? to : from);
        return FALSE;
    }
    return TRUE;
}
