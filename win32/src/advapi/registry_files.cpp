#include "registry_files.h"

#include "kernel/posix_path.h"

#include <vkwin32/winerror.h>

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace vkw32 {
namespace {

std::string HomeDirectory() {
    if (const char* home = std::getenv("HOME"); home != nullptr && *home != '\0')
        return home;
    std::vector<char> buffer(16384);
    struct passwd entry;
    struct passwd* found = nullptr;
    if (getpwuid_r(getuid(), &entry, buffer.data(), buffer.size(), &found) == 0 && found &&
        found->pw_dir != nullptr)
        return found->pw_dir;
    return {};
}

std::string FindDirectory() {
    if (const char* chosen = std::getenv("VASKEL_REGISTRY"); chosen != nullptr && *chosen != '\0')
        return chosen;
    // XDG rules ignore a relative XDG_DATA_HOME.
    if (const char* data = std::getenv("XDG_DATA_HOME"); data != nullptr && *data == '/')
        return std::string(data) + "/vaskel/registry";
    const std::string home = HomeDirectory();
    return home.empty() ? home : home + "/.local/share/vaskel/registry";
}

// mkdir applies the umask, which may take the owner's own rights away.
LONG MakeDirectory(const std::string& path) {
    if (::mkdir(path.c_str(), 0700) == 0)
        return ::chmod(path.c_str(), 0700) == 0 ? ERROR_SUCCESS : ErrorFromErrno(errno);
    const int error = errno;
    struct stat st;
    if (error == EEXIST && ::stat(path.c_str(), &st) == 0 && S_ISDIR(st.st_mode))
        return ERROR_SUCCESS;
    return error == EEXIST ? ERROR_PATH_NOT_FOUND : ErrorFromErrno(error);
}

LONG MakeDirectories(const std::string& path) {
    for (std::string::size_type slash = path.find('/', 1); slash != std::string::npos;
         slash = path.find('/', slash + 1)) {
        if (path[slash - 1] == '/')
            continue;
        if (const LONG error = MakeDirectory(path.substr(0, slash)))
            return error;
    }
    return MakeDirectory(path);
}

} // namespace

const std::string& RegistryDirectory() {
    static const std::string directory = FindDirectory();
    return directory;
}

LONG PrepareDatabaseFile(const std::string& directory, const std::string& file) {
    if (directory.empty())
        return ERROR_PATH_NOT_FOUND;
    if (const LONG error = MakeDirectories(directory))
        return error;
    const int fd = ::open(file.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    if (fd < 0)
        return errno == EEXIST ? ERROR_SUCCESS : ErrorFromErrno(errno);
    const LONG error = ::fchmod(fd, 0600) == 0 ? ERROR_SUCCESS : ErrorFromErrno(errno);
    ::close(fd);
    return error;
}

} // namespace vkw32
