// The DLL's entry point: the loader calls it after the runtime has run the
// static constructors, and before it runs their destructors.
#include "module_lifetime.h"

#include <vaskel/win32.h>

extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID /*reserved*/) {
    switch (reason) {
    case DLL_PROCESS_ATTACH:
        DisableThreadLibraryCalls(instance);
        try {
            vaskel::ModuleStartup();
        } catch (...) {
            return FALSE; // the library cannot work: the load fails
        }
        break;
    case DLL_PROCESS_DETACH:
        vaskel::ModuleShutdown();
        break;
    default:
        break;
    }
    return TRUE;
}
