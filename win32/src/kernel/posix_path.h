// Translation of Win32 path names and error numbers at the system-call boundary.
#pragma once

#include <vkwin32/types.h>

#include <string>

namespace vkw32 {

// The POSIX form of a Win32 path: backslashes become slashes. A drive letter
// or a UNC name has no meaning here and gives false with the error a missing
// path gives on Windows.
bool ToPosixPath(LPCSTR path, std::string& posix);

// The Win32 error code closest to an errno value.
DWORD ErrorFromErrno(int error);
void SetLastErrorFromErrno(int error);

} // namespace vkw32
