// Local memory: fixed blocks only, whose handle is their address. Live blocks
// are entered in a set, so that freeing a stale or foreign handle fails with
// ERROR_INVALID_HANDLE instead of handing the heap a pointer it never gave.
#include <vkwin32/kernel.h>

#include <cstddef>
#include <cstdlib>
#include <limits>
#include <mutex>
#include <unordered_set>

namespace {

struct Registry {
    std::mutex mutex;
    std::unordered_set<HLOCAL> blocks;
};

Registry& Blocks() {
    static Registry* registry = new Registry; // outlives every static destructor
    return *registry;
}

// Above this the heap cannot serve a request; refusing it here also keeps a
// sanitizer's allocator from aborting on it.
const SIZE_T maxBytes = static_cast<SIZE_T>(std::numeric_limits<std::ptrdiff_t>::max());

constexpr UINT kMoveable = 0x0002; // LMEM_MOVEABLE, which this platform does not offer

} // namespace

extern "C" HLOCAL WINAPI LocalAlloc(UINT flags, SIZE_T bytes) {
    if (flags & kMoveable) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return nullptr;
    }
    if (bytes > maxBytes) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    // A fixed block needs an address of its own, even of no bytes.
    const SIZE_T size = bytes == 0 ? 1 : bytes;
    HLOCAL block = (flags & LMEM_ZEROINIT) ? std::calloc(size, 1) : std::malloc(size);
    if (!block) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    registry.blocks.insert(block);
    return block;
}

extern "C" HLOCAL WINAPI LocalFree(HLOCAL memory) {
    if (!memory)
        return nullptr;
    Registry& registry = Blocks();
    {
        std::lock_guard<std::mutex> lock(registry.mutex);
        if (registry.blocks.erase(memory) == 0) {
            SetLastError(ERROR_INVALID_HANDLE);
            return memory;
        }
    }
    std::free(memory);
    return nullptr;
}
