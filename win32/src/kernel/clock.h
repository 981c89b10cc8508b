// The system's millisecond clock, shared by GetTickCount and timeGetTime.
#pragma once

#include <vkwin32/types.h>

namespace vkw32 {

// Milliseconds of the monotonic clock plus the test offset. The tick count
// reads the coarse clock, which is cheaper and, like the tick count on
// Windows, advances in steps of a few milliseconds; the multimedia time
// reads the precise one, so that timer events find their due time reached.
ULONGLONG MillisecondClock();
ULONGLONG PreciseMillisecondClock();

} // namespace vkw32
