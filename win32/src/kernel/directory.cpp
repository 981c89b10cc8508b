// Creating and removing directories.
#include "file_status.h"
#include "posix_path.h"

#include <vkwin32/kernel.h>

#include <cerrno>
#include <sys/stat.h>
#include <unistd.h>

extern "C" BOOL WINAPI CreateDirectoryA(LPCSTR pathName,
                                        LPSECURITY_ATTRIBUTES /*securityAttributes*/) {
    std::string path;
    if (!vkw32::ToPosixPath(pathName, path))
        return FALSE;
    if (::mkdir(path.c_str(), 0777) != 0) {
        const int error = errno;
        // Whatever holds the name, file or directory, it exists; and only the
        // directories on the way can be missing.
        if (error == EEXIST)
            SetLastError(ERROR_ALREADY_EXISTS);
        else if (error == ENOENT)
            SetLastError(ERROR_PATH_NOT_FOUND);
        else
            vkw32::SetLastErrorFromErrno(error);
        return FALSE;
    }
    return TRUE;
}

extern "C" BOOL WINAPI RemoveDirectoryA(LPCSTR pathName) {
    std::string path;
    if (!vkw32::ToPosixPath(pathName, path))
        return FALSE;
    struct stat own;
    if (::lstat(path.c_str(), &own) == 0) {
        struct stat target;
        if (S_ISLNK(own.st_mode)) {
            // A link to a directory goes as Windows removes a directory link:
            // the link alone, never what it names.
            if (::stat(path.c_str(), &target) != 0 || !S_ISDIR(target.st_mode)) {
                SetLastError(ERROR_DIRECTORY);
                return FALSE;
            }
            if (::unlink(path.c_str()) != 0) {
                vkw32::SetLastErrorFromErrno(errno);
                return FALSE;
            }
            return TRUE;
        }
        if (!S_ISDIR(own.st_mode)) {
            SetLastError(ERROR_DIRECTORY);
            return FALSE;
        }
        if (vkw32::IsReadOnly(own)) {
            SetLastError(ERROR_ACCESS_DENIED);
            return FALSE;
        }
    }
    if (::rmdir(path.c_str()) != 0) {
        const int error = errno;
        if (error == ENOTEMPTY || error == EEXIST)
            SetLastError(ERROR_DIR_NOT_EMPTY);
        else
            vkw32::SetPathError(error, path);
        return FALSE;
    }
    return TRUE;
}
