// The calling thread's COM apartment, for the functions that need one.
#pragma once

namespace vkw32 {

// Whether the calling thread has initialised COM and not yet left it.
bool InApartment();

} // namespace vkw32
