#include "file_status.h"

#include "posix_path.h"

#include <vkwin32/kernel.h>

#include <cerrno>

namespace vkw32 {
namespace {

DWORD MissingPathError(const std::string& posix) {
    std::string::size_type slash = posix.find_last_of('/');
    if (slash == std::string::npos || slash == 0)
        return ERROR_FILE_NOT_FOUND;
    struct stat st;
    std::string parent = posix.substr(0, slash);
    if (::stat(parent.c_str(), &st) == 0 && S_ISDIR(st.st_mode))
        return ERROR_FILE_NOT_FOUND;
    return ERROR_PATH_NOT_FOUND;
}

} // namespace

FILETIME ToFileTime(const struct timespec& time) {
    const ULONGLONG epochDifference = 11644473600ull;
    ULONGLONG ticks = (static_cast<ULONGLONG>(time.tv_sec) + epochDifference) * 10000000ull +
                      static_cast<ULONGLONG>(time.tv_nsec) / 100;
    FILETIME ft;
    ft.dwLowDateTime = static_cast<DWORD>(ticks);
    ft.dwHighDateTime = static_cast<DWORD>(ticks >> 32);
    return ft;
}

bool IsReadOnly(const struct stat& status) {
    return (status.st_mode & (S_IWUSR | S_IWGRP | S_IWOTH)) == 0;
}

DWORD AttributesOf(const struct stat& status) {
    DWORD attributes = S_ISDIR(status.st_mode) ? FILE_ATTRIBUTE_DIRECTORY : FILE_ATTRIBUTE_ARCHIVE;
    if (IsReadOnly(status))
        attributes |= FILE_ATTRIBUTE_READONLY;
    return attributes;
}

void SetPathError(int error, const std::string& posix) {
    SetLastError(error == ENOENT ? MissingPathError(posix) : ErrorFromErrno(error));
}

} // namespace vkw32
