#include <vaskel/diag.h>

namespace vaskel {
namespace {

// Read and write access, as the switches have always been opened.
const REGSAM readWriteAccess = 0x2001F;

bool ReadSwitch(const char* valueName) {
    HKEY key = nullptr;
    if (RegOpenKeyExA(HKEY_CURRENT_USER, "Software\\Orvalen\\Zephrane\\Common\\DeveloperMode", 0,
                      readWriteAccess, &key) != ERROR_SUCCESS)
        return false;
    // Any type: only whether the first four bytes are non-zero counts.
    DWORD value = 0;
    DWORD size = sizeof value;
    RegQueryValueExA(key, valueName, nullptr, nullptr, reinterpret_cast<BYTE*>(&value), &size);
    RegCloseKey(key);
    return value != 0;
}

} // namespace

// Decided once per process, even when the registry cannot be read; a local
// static makes the first read safe from several threads at once.
bool IsDeveloperMode() {
    static const bool developerMode = ReadSwitch("DeveloperMode");
    return developerMode;
}

bool VKIgnoreAssert() {
    static const bool ignoreAssert = ReadSwitch("IgnoreAssert");
    return ignoreAssert;
}

} // namespace vaskel
