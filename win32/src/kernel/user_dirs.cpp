#include "user_dirs.h"

#include "posix_path.h"

#include <vkwin32/winerror.h>

#include <cerrno>
#include <cstdlib>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace vkw32 {
namespace {

// mkdir applies the umask, which may take the owner's own rights away.
DWORD MakeDirectory(const std::string& path) {
    if (::mkdir(path.c_str(), 0700) == 0)
        return ::chmod(path.c_str(), 0700) == 0 ? ERROR_SUCCESS : ErrorFromErrno(errno);
    const int error = errno;
    struct stat st;
    if (error == EEXIST && ::stat(path.c_str(), &st) == 0 && S_ISDIR(st.st_mode))
        return ERROR_SUCCESS;
    return error == EEXIST ? ERROR_PATH_NOT_FOUND : ErrorFromErrno(error);
}

} // namespace

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

std::string XdgBaseDirectory(const char* variable, const char* belowHome) {
    // The rules ignore a relative path in the variable.
    if (const char* chosen = std::getenv(variable); chosen != nullptr && *chosen == '/')
        return chosen;
    const std::string home = HomeDirectory();
    return home.empty() ? home : home + "/" + belowHome;
}

DWORD CreatePrivateDirectories(const std::string& path) {
    for (std::string::size_type slash = path.find('/', 1); slash != std::string::npos;
         slash = path.find('/', slash + 1)) {
        if (path[slash - 1] == '/')
            continue;
        if (const DWORD error = MakeDirectory(path.substr(0, slash)))
            return error;
    }
    return MakeDirectory(path);
}

} // namespace vkw32
