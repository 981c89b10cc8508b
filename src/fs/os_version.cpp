#include "os_version.h"

#include <vaskel/fs.h>

namespace vaskel {
namespace {

// False when the platform does not tell its version.
bool PlatformIsAtLeast(DWORD major, DWORD minor) {
    OSVERSIONINFOA version{};
    version.dwOSVersionInfoSize = sizeof version;
    return GetVersionExA(&version) &&
           detail::IsVersionAtLeast(version.dwMajorVersion, version.dwMinorVersion, major, minor);
}

} // namespace

// Each answer is fixed by the first call, once, whichever thread makes it.
bool IsWindows2KOrBetter() {
    static const bool answer = PlatformIsAtLeast(5, 0);
    return answer;
}

bool IsWindows7OrBetter() {
    static const bool answer = PlatformIsAtLeast(6, 1);
    return answer;
}

} // namespace vaskel
