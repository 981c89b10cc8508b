#include "handle_table.h"

#include "process.h"
#include "thread.h"

#include <vkwin32/kernel.h>
#include <vkwin32/synch.h>

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
    if (handle == GetCurrentThread())
        return CurrentThreadObject();
    if (handle == GetCurrentProcess())
        return CurrentProcessObject();
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

namespace {

bool IsPseudoHandle(HANDLE handle) {
    return handle == GetCurrentProcess() || handle == GetCurrentThread();
}

} // namespace

extern "C" HANDLE WINAPI GetCurrentProcess(void) {
    return reinterpret_cast<HANDLE>(static_cast<LONG_PTR>(-1));
}

extern "C" BOOL WINAPI DuplicateHandle(HANDLE sourceProcess, HANDLE sourceHandle,
                                       HANDLE targetProcess, LPHANDLE targetHandle,
                                       DWORD /*desiredAccess*/, BOOL /*inheritHandle*/,
                                       DWORD options) {
    // Only this process exists here.
    if (sourceProcess != GetCurrentProcess() || targetProcess != GetCurrentProcess()) {
        SetLastError(ERROR_INVALID_HANDLE);
        return FALSE;
    }
    std::shared_ptr<vkw32::KernelObject> object = vkw32::LookupHandle(sourceHandle);
    if (options & DUPLICATE_CLOSE_SOURCE && !IsPseudoHandle(sourceHandle))
        vkw32::RemoveHandle(sourceHandle);
    if (!object) {
        SetLastError(ERROR_INVALID_HANDLE);
        return FALSE;
    }
    if (targetHandle == nullptr) {
        if (options & DUPLICATE_CLOSE_SOURCE)
            return TRUE;
        SetLastError(ERROR_INVALID_PARAMETER);
        return FALSE;
    }
    *targetHandle = vkw32::InsertHandle(std::move(object));
    return TRUE;
}

extern "C" BOOL WINAPI CloseHandle(HANDLE object) {
    // Closing a pseudo-handle does nothing and succeeds, as on Windows.
    if (IsPseudoHandle(object))
        return TRUE;
    // The object itself is released outside the table's lock: closing a file
    // may block.
    std::shared_ptr<vkw32::KernelObject> removed = vkw32::RemoveHandle(object);
    if (!removed) {
        SetLastError(ERROR_INVALID_HANDLE);
        return FALSE;
    }
    return TRUE;
}
