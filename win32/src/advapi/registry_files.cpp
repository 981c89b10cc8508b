#include "registry_files.h"

#include "kernel/posix_path.h"
#include "kernel/user_dirs.h"

#include <vkwin32/winerror.h>

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace vkw32 {
namespace {

std::string FindDirectory() {
    if (const char* chosen = std::getenv("VASKEL_REGISTRY"); chosen != nullptr && *chosen != '\0')
        return chosen;
    const std::string data = XdgBaseDirectory("XDG_DATA_HOME", ".local/share");
    return data.empty() ? data : data + "/vaskel/registry";
}

} // namespace

const std::string& RegistryDirectory() {
    static const std::string directory = FindDirectory();
    return directory;
}

LONG PrepareDatabaseFile(const std::string& directory, const std::string& file) {
    if (directory.empty())
        return ERROR_PATH_NOT_FOUND;
    if (const LONG error = static_cast<LONG>(CreatePrivateDirectories(directory)))
        return error;
    const int fd = ::open(file.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    if (fd < 0)
        return errno == EEXIST ? ERROR_SUCCESS : ErrorFromErrno(errno);
    const LONG error = ::fchmod(fd, 0600) == 0 ? ERROR_SUCCESS : ErrorFromErrno(errno);
    ::close(fd);
    return error;
}

} // namespace vkw32
