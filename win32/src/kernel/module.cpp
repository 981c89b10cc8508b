#include "module.h"

#include "process.h"

#include <vkwin32/kernel.h>
#include <vkwin32/winreg.h>

#include <dlfcn.h>
#include <strings.h>

#include <cstring>

namespace {

// Stand-ins for module images: addresses no other handle has.
char programImage;
char advapiImage;

struct Export {
    const char* name;
    FARPROC address;
};

// Through void (*)(), the one pointer type every function pointer converts
// to without a warning.
template <class Function>
FARPROC AsFarProc(Function* function) {
    return reinterpret_cast<FARPROC>(reinterpret_cast<void (*)()>(function));
}

// The functions callers look up by name because older systems lack them.
const Export advapiExports[] = {
    {"RegDeleteKeyExA", AsFarProc(&RegDeleteKeyExA)},
};

bool IsModuleName(LPCSTR name, const char* baseName) {
    const std::size_t length = std::strlen(baseName);
    return strncasecmp(name, baseName, length) == 0 &&
           (name[length] == '\0' || strcasecmp(name + length, ".dll") == 0);
}

} // namespace

namespace vkw32 {

bool ModuleFilePath(HMODULE module, std::string& path) {
    if (module == nullptr || module == reinterpret_cast<HMODULE>(&programImage))
        return ProgramPath(GetCurrentProcessId(), path);
    Dl_info library;
    if (module == reinterpret_cast<HMODULE>(&advapiImage) &&
        ::dladdr(reinterpret_cast<void*>(&advapiImage), &library) != 0 &&
        library.dli_fname != nullptr) {
        path = library.dli_fname;
        return true;
    }
    SetLastError(ERROR_INVALID_HANDLE);
    return false;
}

} // namespace vkw32

extern "C" HMODULE WINAPI GetModuleHandleA(LPCSTR moduleName) {
    if (!moduleName)
        return reinterpret_cast<HMODULE>(&programImage);
    if (IsModuleName(moduleName, "advapi32"))
        return reinterpret_cast<HMODULE>(&advapiImage);
    SetLastError(ERROR_MOD_NOT_FOUND);
    return nullptr;
}

extern "C" FARPROC WINAPI GetProcAddress(HMODULE module, LPCSTR procName) {
    // Names only: ordinals (values below 0x10000) have no meaning here.
    if (module == reinterpret_cast<HMODULE>(&advapiImage) && procName &&
        reinterpret_cast<ULONG_PTR>(procName) > 0xFFFF) {
        for (const Export& entry : advapiExports) {
            if (std::strcmp(entry.name, procName) == 0)
                return entry.address;
        }
    }
    SetLastError(ERROR_PROC_NOT_FOUND);
    return nullptr;
}
