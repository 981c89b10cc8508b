// The version rule of the operating-system tests.
#pragma once

#include <vaskel/win32.h>

namespace vaskel {
namespace detail {

inline bool IsVersionAtLeast(DWORD major, DWORD minor, DWORD wantedMajor, DWORD wantedMinor) {
    return major > wantedMajor || (major == wantedMajor && minor >= wantedMinor);
}

} // namespace detail
} // namespace vaskel
