// Whether the tests run under Wine, which departs from documented Windows
// behaviour in a few places; tests skip only those checks there.
#pragma once

#include <vaskel/win32.h>

namespace vaskel_test {

inline bool RunningOnWine() {
#ifdef _WIN32
    HMODULE ntdll = GetModuleHandleA("ntdll.dll");
    return ntdll != nullptr && GetProcAddress(ntdll, "wine_get_version") != nullptr;
#else
    return false;
#endif
}

} // namespace vaskel_test
