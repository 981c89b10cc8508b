#include <vaskel/registry.h>

#include <cstdio>

namespace vaskel {

CString COMRegistry::GetLocalServer32Value(const char* clsid) {
    char path[MAX_PATH];
    // A class identifier too long for the path finds nothing.
    const int length =
        std::snprintf(path, sizeof path, "CLSID\\%s\\LocalServer32", clsid ? clsid : "");
    if (length < 0 || length >= static_cast<int>(sizeof path))
        return CString();
    CRegistry key(HKEY_CLASSES_ROOT, path, true, false);
    return key.IsValid() ? key.GetString(nullptr, "") : CString();
}

} // namespace vaskel
