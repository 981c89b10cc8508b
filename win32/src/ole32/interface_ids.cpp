// The identifiers of the system's interfaces, one definition each.
#include <vkwin32/oaidl.h>
#include <vkwin32/unknwn.h>

extern "C" {

const IID IID_IUnknown = {0x00000000, 0x0000, 0x0000, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};
const IID IID_IDispatch = {0x00020400, 0x0000, 0x0000, {0xC0, 0, 0, 0, 0, 0, 0, 0x46}};

} // extern "C"
