// Global memory. Every live block is entered in a registry, and a handle is
// looked up there before anything is done with it: a stale or foreign handle
// fails with ERROR_INVALID_HANDLE instead of being dereferenced.
#include <vkwin32/kernel.h>

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <mutex>
#include <unordered_map>

namespace {

struct Block {
    void* data = nullptr; // null for a discarded movable block
    SIZE_T size = 0;      // as asked for
    SIZE_T capacity = 0;  // as allocated, so that a shrunk block may grow back in place
    DWORD locks = 0;      // movable blocks only
    bool movable = false;
};

// A fixed block is keyed by its address, a movable one by the address of its
// Block record, which is also its handle; both are live heap addresses, so no
// two blocks share a key.
struct Registry {
    std::mutex mutex;
    std::unordered_map<HGLOBAL, std::unique_ptr<Block>> blocks;
    std::unordered_map<const void*, HGLOBAL> movableData; // for GlobalHandle
};

Registry& Blocks() {
    static Registry* registry = new Registry; // outlives every static destructor
    return *registry;
}

// Above this the heap cannot serve a request; refusing it here also keeps a
// sanitizer's allocator from aborting on it.
const SIZE_T maxBytes = static_cast<SIZE_T>(std::numeric_limits<std::ptrdiff_t>::max());

Block* Find(Registry& registry, HGLOBAL handle) {
    auto it = registry.blocks.find(handle);
    if (it == registry.blocks.end()) {
        SetLastError(ERROR_INVALID_HANDLE);
        return nullptr;
    }
    return it->second.get();
}

void* AllocateData(SIZE_T bytes, bool zero) {
    return zero ? std::calloc(bytes, 1) : std::malloc(bytes);
}

} // namespace

extern "C" HGLOBAL WINAPI GlobalAlloc(UINT flags, SIZE_T bytes) {
    if (bytes > maxBytes) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    auto block = std::make_unique<Block>();
    block->movable = (flags & GMEM_MOVEABLE) != 0;
    // A movable block of no bytes starts discarded; a fixed one needs an
    // address of its own, and gets one byte, as on Windows.
    if (!block->movable && bytes == 0)
        bytes = 1;
    if (bytes > 0) {
        block->data = AllocateData(bytes, (flags & GMEM_ZEROINIT) != 0);
        if (!block->data) {
            SetLastError(ERROR_NOT_ENOUGH_MEMORY);
            return nullptr;
        }
    }
    block->size = block->capacity = bytes;
    HGLOBAL handle = block->movable ? static_cast<HGLOBAL>(block.get()) : block->data;
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    if (block->movable && block->data)
        registry.movableData.emplace(block->data, handle);
    registry.blocks.emplace(handle, std::move(block));
    return handle;
}

extern "C" HGLOBAL WINAPI GlobalReAlloc(HGLOBAL memory, SIZE_T bytes, UINT flags) {
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    Block* block = Find(registry, memory);
    if (!block)
        return nullptr;
    // Only the attributes would change, and none of those kept here can.
    if (flags & GMEM_MODIFY)
        return memory;
    if (bytes > maxBytes) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    const bool zero = (flags & GMEM_ZEROINIT) != 0;
    if (block->movable && bytes == 0 && block->locks == 0) {
        registry.movableData.erase(block->data);
        std::free(block->data);
        block->data = nullptr;
        block->size = block->capacity = 0;
        return memory;
    }
    if (block->data && bytes <= block->capacity) {
        if (zero && bytes > block->size)
            std::memset(static_cast<char*>(block->data) + block->size, 0, bytes - block->size);
        block->size = bytes;
        return memory;
    }
    // A locked movable block, and a fixed block unless asked otherwise, may
    // only change in place.
    const bool mayMove = (block->movable && block->locks == 0) || (flags & GMEM_MOVEABLE) != 0;
    if (!mayMove) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    void* data = std::realloc(block->data, bytes);
    if (!data) {
        SetLastError(ERROR_NOT_ENOUGH_MEMORY);
        return nullptr;
    }
    if (zero)
        std::memset(static_cast<char*>(data) + block->size, 0, bytes - block->size);
    void* old = block->data;
    block->data = data;
    block->size = block->capacity = bytes;
    if (block->movable) {
        registry.movableData.erase(old);
        registry.movableData.emplace(data, memory);
        return memory;
    }
    auto entry = registry.blocks.extract(memory);
    entry.key() = data;
    registry.blocks.insert(std::move(entry));
    return data;
}

extern "C" HGLOBAL WINAPI GlobalFree(HGLOBAL memory) {
    if (!memory)
        return nullptr;
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    Block* block = Find(registry, memory);
    if (!block)
        return memory;
    // A locked block is freed too, as documented.
    if (block->movable)
        registry.movableData.erase(block->data);
    std::free(block->data);
    registry.blocks.erase(memory);
    return nullptr;
}

extern "C" LPVOID WINAPI GlobalLock(HGLOBAL memory) {
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    Block* block = Find(registry, memory);
    if (!block)
        return nullptr;
    if (!block->movable)
        return block->data;
    if (!block->data) {
        SetLastError(ERROR_DISCARDED);
        return nullptr;
    }
    ++block->locks;
    return block->data;
}

extern "C" BOOL WINAPI GlobalUnlock(HGLOBAL memory) {
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    Block* block = Find(registry, memory);
    if (!block)
        return FALSE;
    if (!block->movable)
        return TRUE;
    if (block->locks == 0) {
        SetLastError(ERROR_NOT_LOCKED);
        return FALSE;
    }
    if (--block->locks > 0)
        return TRUE;
    // FALSE here is not a failure: the caller tells the two apart by the last error.
    SetLastError(NO_ERROR);
    return FALSE;
}

extern "C" SIZE_T WINAPI GlobalSize(HGLOBAL memory) {
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    Block* block = Find(registry, memory);
    return block ? block->size : 0;
}

extern "C" HGLOBAL WINAPI GlobalHandle(LPCVOID memory) {
    Registry& registry = Blocks();
    std::lock_guard<std::mutex> lock(registry.mutex);
    auto movable = registry.movableData.find(memory);
    if (movable != registry.movableData.end())
        return movable->second;
    HGLOBAL fixed = const_cast<LPVOID>(memory);
    auto block = registry.blocks.find(fixed);
    if (block != registry.blocks.end() && !block->second->movable)
        return fixed;
    SetLastError(ERROR_INVALID_HANDLE);
    return nullptr;
}
