// The system's millisecond clock, shared by GetTickCount and timeGetTime.
#pragma once

#include <vkwin32/types.h>

namespace vkw32 {

// Milliseconds of the monotonic clock plus the test offset.
ULONGLONG MillisecondClock();

} // namespace vkw32
