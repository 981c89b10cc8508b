// Task memory: the heap's rules on top of malloc. A block of no bytes still
// gets an address of its own, so that two of them never compare equal.
#include <vkwin32/objbase.h>

#include <cstddef>
#include <cstdlib>
#include <limits>

namespace {

// Above this the heap cannot serve a request; refusing it here also keeps a
// sanitizer's allocator from aborting on it.
const SIZE_T maxBytes = static_cast<SIZE_T>(std::numeric_limits<std::ptrdiff_t>::max());

} // namespace

extern "C" LPVOID WINAPI CoTaskMemAlloc(SIZE_T bytes) {
    if (bytes > maxBytes)
        return nullptr;
    return std::malloc(bytes == 0 ? 1 : bytes);
}

extern "C" LPVOID WINAPI CoTaskMemRealloc(LPVOID memory, SIZE_T bytes) {
    if (!memory)
        return CoTaskMemAlloc(bytes);
    if (bytes == 0) {
        std::free(memory);
        return nullptr;
    }
    if (bytes > maxBytes)
        return nullptr; // the old block stays valid, as with realloc
    return std::realloc(memory, bytes);
}

extern "C" void WINAPI CoTaskMemFree(LPVOID memory) {
    std::free(memory);
}
