// Feeds arbitrary text to the object-reference parser and binder. No text
// can name a live object without the process's secret, so every bind must
// fail, leave the output untouched, and neither crash nor leak.
#include <vaskel/object_ref.h>
#include <vaskel/win32.h>

#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const HRESULT com = CoInitializeEx(nullptr, COINIT_MULTITHREADED);
    (void)com;
    const std::string text(reinterpret_cast<const char*>(data), size);
    static char marker;
    IUnknown* const untouched = reinterpret_cast<IUnknown*>(&marker);
    IUnknown* object = untouched;
    if (SUCCEEDED(vaskel::COMObjRef::ParseDisplayName(text.c_str(), IID_IUnknown, &object)) ||
        object != untouched)
        std::abort();
    return 0;
}
