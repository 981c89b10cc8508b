#include <vkwin32/crt.h>

#include <cerrno>
#include <cstring>

extern "C" errno_t localtime_s(struct tm* result, const time_t* time) {
    if (!result)
        return EINVAL;
    if (!time || !localtime_r(time, result)) {
        // The runtime marks every field invalid on failure.
        std::memset(result, 0xff, sizeof *result);
        return EINVAL;
    }
    return 0;
}
