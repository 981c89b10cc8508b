// Directory searches on POSIX directory streams. Each entry is described when
// it is reached, so a search holds one open directory and no list of names.
#include "file_status.h"
#include "handle_table.h"
#include "posix_path.h"
#include "wildcard.h"

#include <vkwin32/kernel.h>

#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <mutex>
#include <sys/stat.h>

namespace vkw32 {
namespace {

class FindObject : public KernelObject {
public:
    FindObject(DIR* directory, std::string pattern, bool root)
        : dir(directory), pattern(std::move(pattern)), atRoot(root) {}
    ~FindObject() override { ::closedir(dir); }

    // Moves to the next entry that matches and describes it. False at the end
    // (ERROR_NO_MORE_FILES) or on an error of the directory stream.
    bool Next(WIN32_FIND_DATAA& data);

private:
    bool Describe(const struct dirent& entry, WIN32_FIND_DATAA& data) const;

    std::mutex mutex; // one stream, whichever thread calls with the handle
    DIR* const dir;
    const std::string pattern;
    // Windows lists no "." and ".." in the root directory of a volume.
    const bool atRoot;
};

bool IsDots(const char* name) {
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

bool FindObject::Next(WIN32_FIND_DATAA& data) {
    std::lock_guard<std::mutex> lock(mutex);
    for (;;) {
        errno = 0;
        const struct dirent* entry = ::readdir(dir);
        if (entry == nullptr) {
            SetLastError(errno == 0 ? ERROR_NO_MORE_FILES : ErrorFromErrno(errno));
            return false;
        }
        if ((atRoot && IsDots(entry->d_name)) || !MatchesWildcard(entry->d_name, pattern))
            continue;
        // An entry removed since the directory was read is passed over.
        if (Describe(*entry, data))
            return true;
    }
}

bool FindObject::Describe(const struct dirent& entry, WIN32_FIND_DATAA& data) const {
    const std::size_t length = std::strlen(entry.d_name);
    if (length >= sizeof data.cFileName)
        return false;
    const int dirFd = ::dirfd(dir);
    struct stat own;
    if (::fstatat(dirFd, entry.d_name, &own, AT_SYMLINK_NOFOLLOW) != 0)
        return false;
    std::memset(&data, 0, sizeof data);
    if (S_ISLNK(own.st_mode)) {
        // A link is a reparse point of the kind of what it names, with its own
        // times and no size, as Windows reports symbolic links.
        struct stat target;
        const bool toDirectory =
            ::fstatat(dirFd, entry.d_name, &target, 0) == 0 && S_ISDIR(target.st_mode);
        data.dwFileAttributes = (toDirectory ? FILE_ATTRIBUTE_DIRECTORY : FILE_ATTRIBUTE_ARCHIVE) |
                                FILE_ATTRIBUTE_REPARSE_POINT;
        data.dwReserved0 = IO_REPARSE_TAG_SYMLINK;
    } else {
        data.dwFileAttributes = AttributesOf(own);
        const ULONGLONG size = S_ISDIR(own.st_mode) ? 0 : static_cast<ULONGLONG>(own.st_size);
        data.nFileSizeHigh = static_cast<DWORD>(size >> 32);
        data.nFileSizeLow = static_cast<DWORD>(size);
    }
    // POSIX keeps no creation time; the status-change time is the nearest.
    data.ftCreationTime = ToFileTime(own.st_ctim);
    data.ftLastAccessTime = ToFileTime(own.st_atim);
    data.ftLastWriteTime = ToFileTime(own.st_mtim);
    std::memcpy(data.cFileName, entry.d_name, length + 1);
    return true;
}

} // namespace
} // namespace vkw32

using vkw32::FindObject;

extern "C" HANDLE WINAPI FindFirstFileA(LPCSTR fileName, LPWIN32_FIND_DATAA findFileData) {
    std::string path;
    if (!vkw32::ToPosixPath(fileName, path))
        return INVALID_HANDLE_VALUE;
    if (findFileData == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return INVALID_HANDLE_VALUE;
    }
    const std::string::size_type slash = path.find_last_of('/');
    std::string pattern = slash == std::string::npos ? path : path.substr(slash + 1);
    std::string directory = slash == std::string::npos ? "." : path.substr(0, slash + 1);
    // A name that ends with a separator names no entry.
    if (pattern.empty()) {
        SetLastError(ERROR_FILE_NOT_FOUND);
        return INVALID_HANDLE_VALUE;
    }
    DIR* dir = ::opendir(directory.c_str());
    if (dir == nullptr) {
        // The directory of the search is missing, or it is a file.
        const int error = errno;
        struct stat st;
        if (error == ENOTDIR && ::stat(directory.substr(0, slash).c_str(), &st) == 0)
            SetLastError(ERROR_DIRECTORY);
        else if (error == ENOENT || error == ENOTDIR)
            SetLastError(ERROR_PATH_NOT_FOUND);
        else
            vkw32::SetLastErrorFromErrno(error);
        return INVALID_HANDLE_VALUE;
    }
    const bool root = directory.find_first_not_of('/') == std::string::npos;
    auto search = std::make_shared<FindObject>(dir, std::move(pattern), root);
    if (!search->Next(*findFileData)) {
        if (GetLastError() == ERROR_NO_MORE_FILES)
            SetLastError(ERROR_FILE_NOT_FOUND);
        return INVALID_HANDLE_VALUE;
    }
    return vkw32::InsertHandle(std::move(search));
}

extern "C" BOOL WINAPI FindNextFileA(HANDLE findFile, LPWIN32_FIND_DATAA findFileData) {
    auto search = vkw32::LookupHandleAs<FindObject>(findFile);
    if (!search)
        return FALSE;
    if (findFileData == nullptr) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    return search->Next(*findFileData) ? TRUE : FALSE;
}

extern "C" BOOL WINAPI FindClose(HANDLE findFile) {
    // Only a search is closed here; any other handle stays open.
    if (!vkw32::LookupHandleAs<FindObject>(findFile))
        return FALSE;
    if (!vkw32::RemoveHandle(findFile)) {
        SetLastError(ERROR_INVALID_HANDLE);
        return FALSE;
    }
    return TRUE;
}
