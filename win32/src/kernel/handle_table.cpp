#include "handle_table.h"

#include <vkwin32/kernel.h>

#include <mutex>
#include <unordered_map>

namespace vkw32 {
namespace {

struct HandleTable {
    std::mutex mutex;
    std::unordered_map<std::uintptr_t, std::shared_ptr<KernelObject>> objects;
    // Handle values are multiples of 4 as on Windows, start well above the
    // pseudo-handles and are not reused, so a stale handle never names a new object.
    std::uintptr_t next = 0x1000;
};

HandleTable& Table() {
    static HandleTable* table = new HandleTable; // outlives every static destructor
    return *table;
}

} // namespace

HANDLE InsertHandle(std::shared_ptr<KernelObject> object) {
    HandleTable& table = Table();
    std::lock_guard<std::mutex> lock(table.mutex);
    std::uintptr_t value = table.next;
    table.next += 4;
    table.objects.emplace(value, std::move(object));
    return reinterpret_cast<HANDLE>(value);
}

std::shared_ptr<KernelObject> LookupHandle(HANDLE handle) {
    HandleTable& table = Table();
    std::lock_guard<std::mutex> lock(table.mutex);
    auto it = table.objects.find(reinterpret_cast<std::uintptr_t>(handle));
    return it == table.objects.end() ? nullptr : it->second;
}

std::shared_ptr<KernelObject> RemoveHandle(HANDLE handle) {
    HandleTable& table = Table();
    std::lock_guard<std::mutex> lock(table.mutex);
    auto it = table.objects.find(reinterpret_cast<std::uintptr_t>(handle));
    if (it == table.objects.end())
        return nullptr;
    std::shared_ptr<KernelObject> object = std::move(it->second);
    table.objects.erase(it);
    return object;
}

void SetInvalidHandleError() {
    SetLastError(ERROR_INVALID_HANDLE);
}

} // namespace vkw32

extern "C" BOOL WINAPI CloseHandle(HANDLE object) {
    // The object itself is released outside the table's lock: closing a file
    // may block.
    std::shared_ptr<vkw32::KernelObject> removed = vkw32::RemoveHandle(object);
    if (!removed) {
        SetLastError(ERROR_INVALID_HANDLE);
        return FALSE;
    }
    return TRUE;
}
