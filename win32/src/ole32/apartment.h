// The calling thread's COM apartment, for the functions that need one.
#pragma once

#include <cstdint>

namespace vkw32 {

// Whether the calling thread has initialised COM and not yet left it.
bool InApartment();

// The calling thread's apartment, 0 outside one. Each single-threaded
// apartment has its own identifier; the threads of the multithreaded
// apartment share one, new each time that apartment is created again.
std::uint64_t CurrentApartment();

// Called as an apartment ends, on the thread that leaves it last: disconnects
// the interfaces marshalled from it (the marshalling table's side).
void DisconnectApartment(std::uint64_t apartment);

} // namespace vkw32
