#include <vkwin32/kernel.h>

namespace {

// A stand-in for the program's image: an address no other handle has.
char programImage;

} // namespace

extern "C" HMODULE WINAPI GetModuleHandleA(LPCSTR moduleName) {
    if (!moduleName)
        return reinterpret_cast<HMODULE>(&programImage);
    SetLastError(ERROR_MOD_NOT_FOUND);
    return nullptr;
}
