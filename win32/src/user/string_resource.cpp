#include <vkwin32/kernel.h>
#include <vkwin32/user.h>

extern "C" int WINAPI LoadStringA(HINSTANCE, UINT, LPSTR buffer, int bufferMax) {
    if (buffer && bufferMax > 0)
        buffer[0] = '\0';
    SetLastError(ERROR_RESOURCE_TYPE_NOT_FOUND);
    return 0;
}
