#include "../kernel/clock.h"

#include <vkwin32/mmsystem.h>

extern "C" DWORD WINAPI timeGetTime(void) {
    return static_cast<DWORD>(vkw32::PreciseMillisecondClock());
}
