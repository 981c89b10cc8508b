// Long and short path forms. POSIX names have no short (8.3) aliases, so
// either form of an existing path is the path as it is written.
#include "file_status.h"
#include "posix_path.h"

#include <vkwin32/kernel.h>

#include <cerrno>
#include <cstring>
#include <sys/stat.h>

namespace {

DWORD CopyExistingPath(LPCSTR from, LPSTR to, DWORD bufferLength) {
    std::string path;
    if (!vkw32::ToPosixPath(from, path))
        return 0;
    struct stat st;
    if (::lstat(path.c_str(), &st) != 0) {
        vkw32::SetPathError(errno, path);
        return 0;
    }
    const std::size_t length = std::strlen(from);
    if (length >= bufferLength)
        return static_cast<DWORD>(length + 1);
    if (to == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return 0;
    }
    // The output may be the input's own buffer.
    std::memmove(to, from, length + 1);
    return static_cast<DWORD>(length);
}

} // namespace

extern "C" DWORD WINAPI GetLongPathNameA(LPCSTR shortPath, LPSTR longPath, DWORD bufferLength) {
    return CopyExistingPath(shortPath, longPath, bufferLength);
}

extern "C" DWORD WINAPI GetShortPathNameA(LPCSTR longPath, LPSTR shortPath, DWORD bufferLength) {
    return CopyExistingPath(longPath, shortPath, bufferLength);
}
