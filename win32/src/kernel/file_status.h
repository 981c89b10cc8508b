// The Win32 view of a POSIX file status and of a failed path lookup, shared
// by the file, directory and search functions.
#pragma once

#include <vkwin32/types.h>

#include <string>
#include <sys/stat.h>
#include <time.h>

namespace vkw32 {

// 100-nanosecond intervals since 1 January 1601.
FILETIME ToFileTime(const struct timespec& time);

// A file nobody may write is FILE_ATTRIBUTE_READONLY: it refuses writers and
// deletion even where POSIX would let the caller through (root).
bool IsReadOnly(const struct stat& status);

DWORD AttributesOf(const struct stat& status);

// ENOENT is either a missing file or a missing directory on the way to it;
// Windows tells the two apart. Other errors map as ErrorFromErrno.
void SetPathError(int error, const std::string& posix);

} // namespace vkw32
